#pragma once

#include "wavemill/Export.h"

#include <cstddef>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// A node of the JSON token tree that model documents are built from and
/// read into: a scalar (JValue), an object (JObject) or an array (JArray).
///
/// This is not a general JSON library. The writer produces one fixed layout
/// (two blanks per level, LF line ends, "$type" first, the other members in
/// ascending byte order of their names), and the reader is a forgiving
/// scanner tuned to that layout: it never throws and never reports an
/// error; on damaged input it stops, skips or keeps what it has, so damage
/// shows up as missing or odd members.
///
/// Tokens are held through std::shared_ptr and have no parent pointers. A
/// tree belongs to the thread that builds or reads it.
class WAVEMILL_API JToken {
public:
  /// A token with the member name `name`; elements of an array have an
  /// empty name.
  explicit JToken(std::string name);

  /// The text form of the token: empty here, and so for arrays and bare
  /// containers, which have no text form of their own.
  virtual std::string toString() const;
  /// Appends the token's text to `out` in the fixed layout; `indent` is the
  /// number of blanks in front of the line the token starts on.
  virtual void append(std::string &out, int indent) const = 0;
  /// Reads the token from `text`, starting the search at `position`, and
  /// moves `position` behind what was read. Never throws for any text or
  /// position: a negative position, a position at or beyond the end and a
  /// text of more than INT_MAX bytes read nothing and leave `position` as
  /// it is. `position` never moves backwards and never passes text.size().
  virtual void parse(const std::string &text, int &position) = 0;
  /// Always 0; kept for callers that ask for it.
  virtual int getTextSize() const;

  virtual ~JToken();

  /// The member name under which the token stands in its object.
  const std::string &getName() const { return name; }

  /// The member name; empty for the elements of an array.
  std::string name;
};

/// A scalar: a string, a number or a boolean, held as the literal text it
/// has in a document. A string keeps its quotation marks and holds the
/// characters between them unescaped, so `"abc"` is held with the marks and
/// `12.5` or `true` are held bare. Writers must quote string values
/// themselves.
class WAVEMILL_API JValue : public JToken {
public:
  JValue(std::string name, std::string value);

  /// The value as it is held, quotation marks included.
  std::string toString() const override;
  /// Appends toEscaped(value); `indent` has no effect on a scalar.
  void append(std::string &out, int indent) const override;
  /// Reads one scalar from `position`. Only the blank (0x20) counts as
  /// white space. The value ends in front of a blank, ",", CR, LF or "}"
  /// outside the quoted stretch; "]" does not end it, so a scalar in an
  /// array must be followed by a comma or a line end. A backslash does not
  /// protect a quotation mark. Afterwards `position` stands on the next
  /// non-blank behind a blank, behind a ",", on the "}" (left for the
  /// object), on the first character behind LFs (a CR stays for the
  /// caller), or stays where it was when the text ends without a stop
  /// character, in which case the value is the first character only.
  ///   `: "a b",` -> value `"a b"`, position behind the ","
  void parse(const std::string &text, int &position) override;

  /// The literal text, quotation marks included.
  const std::string &getValue() const { return value; }
  /// Sets the literal text; a string value must bring its quotation marks.
  void setValue(std::string text) { value = std::move(text); }

  /// The document form of a literal. A text of at least two characters that
  /// begins and ends with the same quotation mark (`"` or `'`) keeps both
  /// marks and escapes the characters between them: TAB, LF and CR as
  /// `\t`, `\n`, `\r`, the double quotation mark and the backslash with a
  /// backslash in front. Everything else, other control characters and
  /// bytes from 0x7F on included, passes as it is; there are no
  /// hexadecimal escapes. Any other text (numbers, booleans) is returned
  /// unchanged.
  ///   `"a<TAB>b"` -> `"a\tb"`, `12.5` -> `12.5`
  static std::string toEscaped(const std::string &text);
  /// The held form of a literal read from a document. A text of at least
  /// four characters that begins and ends with the same quotation mark is
  /// unescaped: a backslash is dropped and the next character taken, `n`,
  /// `r` and `t` giving LF, CR and TAB and any other character standing for
  /// itself. The marks stay. Shorter or unquoted texts are returned as
  /// they are.
  ///   `"a\tb"` -> `"a<TAB>b"`, `"a\"` -> `"a"`
  static std::string toRaw(const std::string &text);

private:
  std::string value;
  /// Values are always escaped on writing; never changed.
  static constexpr bool s_stringEscape = true;
};

/// Common part of objects and arrays: named members kept in byte order of
/// their names, and the object layout of the writer.
class WAVEMILL_API JContainer : public JToken {
public:
  /// Members by name, ordered by the unsigned bytes of the names.
  using Items = std::map<std::string, std::shared_ptr<JToken>>;

  explicit JContainer(std::string name);

  /// Writes the object layout: "{", the member "$type" first, then every
  /// other member with a token in ascending byte order of its name, one per
  /// line at `indent + 2` blanks, and the closing line of `indent` blanks,
  /// LF, `indent` blanks and "}" with LF. A nested object's final LF puts
  /// the following comma on a line of its own. The order of adding makes no
  /// difference. Every written object is expected to carry "$type"; one
  /// without it is written without that line, and its first member then
  /// stands where "$type" would have stood. A negative `indent` counts as
  /// 0.
  void append(std::string &out, int indent) const override;
  void parse(const std::string &text, int &position) override = 0;

  /// Sets the member `name` to `token`, replacing an earlier token of that
  /// name, and records `name` in getItemNames() in any case.
  void add(const std::string &name, std::shared_ptr<JToken> token);
  /// add() under the token's own name; an empty pointer is ignored.
  void addToken(std::shared_ptr<JToken> token);
  /// True if a member `name` exists, even one with an empty token.
  bool hasItem(const std::string &name) const;
  /// The member `name`, or an empty pointer; never adds a member.
  std::shared_ptr<JToken> getItem(const std::string &name) const;

  /// The members in the order of their names.
  const Items &getItems() const { return items; }
  /// The names in the order they were added or read, with a name as often
  /// as it was added. The writer does not use it.
  const std::vector<std::string> &getItemNames() const { return itemNames; }
  /// Makes room for the names of `count` members, for a writer that knows
  /// how many it will add.
  void reserve(std::size_t count) { itemNames.reserve(count); }

protected:
  Items items;
  std::vector<std::string> itemNames;

private:
  static void appendItem(std::string &out, const std::string &name, const std::shared_ptr<JToken> &token, int indent);
};

/// A JSON object: a model or a collection in a document.
///
///   JObject root;
///   root.add("$type", std::make_shared<JValue>("$type", "\"Lab.Bench, Lab\""));
///   std::string text = root.toString();
class WAVEMILL_API JObject : public JContainer {
public:
  explicit JObject(std::string name = "");

  /// The whole document of this object, written with indent 0.
  std::string toString() const override;
  /// Reads an object from the first "{" at or after `position`, adding
  /// every member found to the ones already held; `position` ends behind
  /// the closing "}" or at text.size(). A text without "{" leaves
  /// everything as it is. A member's name is the text between the next two
  /// quotation marks, taken without unescaping. Its value is the first of:
  /// a quotation mark, a character from "+" to "9", "t", "T", "f" or "F"
  /// (a scalar), "{" (an object) or "[" (an array); the scanner passes over
  /// everything else, so `null` and other bare words are not values, and a
  /// member whose value the scanner doesn't find before the "}" is dropped.
  /// A repeated name replaces the earlier member and is listed again in
  /// getItemNames(). Containers nested more than 512 levels deep are not
  /// read: the deepest one stays empty and reading ends there, with
  /// `position` at text.size(), so that hostile input cannot exhaust the
  /// stack.
  void parse(const std::string &text, int &position) override;

private:
  friend class JArray;
  void parseNested(const std::string &text, int &position, int depth);
  // Reads the object, array or scalar that starts at `position` (one of
  // "{", "[" or a scalar's first character) under the name `name`.
  static std::shared_ptr<JToken> readToken(const std::string &text, int &position, std::string name, int depth);
};

/// A JSON array: the elements in order, each with an empty name. The
/// members of JContainer stay empty.
class WAVEMILL_API JArray : public JContainer {
public:
  explicit JArray(std::string name = "");

  /// Writes "[", one element per line at `indent + 2` blanks separated by
  /// commas, and `indent` blanks with "]", without a line end. Empty
  /// pointers are not written.
  void append(std::string &out, int indent) const override;
  /// Reads an array from the first "[" at or after `position`; `position`
  /// ends behind the closing "]" or at text.size(). An element is the
  /// first of: a quotation mark or a character from "+" to "9" other than
  /// "," (a scalar), "{" or "["; everything else is passed over, so
  /// `true` and `false` give no element. Since "]" doesn't end a scalar,
  /// `[1, 2]` on one line reads as `1` and `2]`. An element that runs into
  /// the end of the text without a stop character ends the array there,
  /// with `position` at text.size(). Nesting is limited as in
  /// JObject::parse.
  void parse(const std::string &text, int &position) override;

  /// Appends an element.
  void addElement(std::shared_ptr<JToken> token);
  /// The elements in order.
  const std::vector<std::shared_ptr<JToken>> &getTokens() const { return tokens; }

private:
  friend class JObject;
  void parseNested(const std::string &text, int &position, int depth);

  std::vector<std::shared_ptr<JToken>> tokens;
};

} // namespace Corvane::Wavemill
