#pragma once

#include "wavemill/Export.h"

#include <string>

namespace Corvane::Wavemill {

/// Text functions that turn a compiler's function-signature text into the
/// full type name and the short type name of the class the function belongs
/// to. Model classes call them once per class, from inside their
/// getTypeName() and getFullTypeName() members, and keep the result in a
/// static (see WAVEMILL_TYPE_NAME and WAVEMILL_FULL_TYPE_NAME).
///
/// The input has the form "<result> <Namespace::Class>::<member>(void) const":
/// the member's name stands behind the last ":", the class in front of that
/// "::", and a blank in front of the class. Examples, behind the result type:
///   "Corvane::Wavemill::TextModel::getFullTypeName(void) const"
///     -> full "Corvane.Wavemill.TextModel", short "TextModel"
///   "Corvane::Wavemill::Box<int>::getFullTypeName(void) const"
///     -> full "Corvane::Wavemill::Box`1[[int]]", short "Box`1[[int]]"
class WAVEMILL_API RunTime {
public:
  RunTime() = delete;

  /// The full type name of the class whose member has `signature`; `size`
  /// counts the terminator. An empty text gives an empty string.
  static std::string doGetFullTypeName(const char *signature, int size);

  /// The short type name of the class whose member has `signature`; `size`
  /// counts the terminator. An empty text gives an empty string.
  static std::string doGetTypeName(const char *signature, int size);

  /// What follows the last ":" of `name`, else what follows its last blank
  /// before the final character, else the name as it is:
  /// "class Corvane::Wavemill::TextPair" -> "TextPair", "class Foo> " -> "Foo> ".
  /// A ":" or blank at index 0 does not count.
  static std::string getShortClassName(const std::string &name);

  /// Rewrites g++'s __PRETTY_FUNCTION__ text of a member function into the
  /// signature form above: template parameters are replaced by the arguments
  /// of the "[with ...]" clause, which is dropped, the parameter list becomes
  /// "(void)", qualifiers such as " const" stay and a leading "virtual",
  /// "static" or "constexpr" goes. Arguments keep g++'s spelling, and an
  /// argument that ends in ">" is kept apart from the class's own ">" by a
  /// blank, as g++ writes nested templates. A text that has no parameter
  /// list comes back without its clause but otherwise unchanged. Example:
  ///   "std::string Ns::Box<T>::name() const [with T = Ns::Pair; ...]"
  ///     -> "std::string Ns::Box<Ns::Pair>::name(void) const"
  static std::string adaptSignature(const char *prettyFunction);

  /// doGetFullTypeName of the adapted text of `prettyFunction`.
  static std::string fullTypeNameOf(const char *prettyFunction);

  /// doGetTypeName of the adapted text of `prettyFunction`.
  static std::string typeNameOf(const char *prettyFunction);

  /// The index of the last `wanted` at or below `from`, walking down to 0;
  /// -1 when `text` is empty or null, `from` is negative or nothing was
  /// found. `from` may be the index of the terminator; a larger one is read
  /// as that index.
  static int lastIndexOf(const char *text, char wanted, int from);
};

} // namespace Corvane::Wavemill

/// Inside a member function of a model class: the class's short type name,
/// computed once and then returned from a static.
#define WAVEMILL_TYPE_NAME()                                                                                           \
  ([](const char *signature) -> const std::string & {                                                                  \
    static const std::string name = ::Corvane::Wavemill::RunTime::typeNameOf(signature);                               \
    return name;                                                                                                       \
  }(__PRETTY_FUNCTION__))

/// Inside a member function of a model class: the class's full type name,
/// computed once and then returned from a static.
#define WAVEMILL_FULL_TYPE_NAME()                                                                                      \
  ([](const char *signature) -> const std::string & {                                                                  \
    static const std::string name = ::Corvane::Wavemill::RunTime::fullTypeNameOf(signature);                           \
    return name;                                                                                                       \
  }(__PRETTY_FUNCTION__))
