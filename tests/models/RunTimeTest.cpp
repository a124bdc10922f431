#include "wavemill/models/RunTime.h"

#include <gtest/gtest.h>

#include <string>

using Corvane::Wavemill::RunTime;

// Small classes that name themselves the way the model classes do; the names
// are unusual so that they cannot meet a real class of the test program.
struct RunTimeProbePlain {
  const std::string &getTypeName() const { return WAVEMILL_TYPE_NAME(); }
  const std::string &getFullTypeName() const { return WAVEMILL_FULL_TYPE_NAME(); }
};

namespace Corvane::Wavemill {

struct RunTimeProbeBase {
  virtual ~RunTimeProbeBase() = default;
  virtual const std::string &getTypeName() const = 0;
  virtual std::string getFullTypeName() const = 0;
};

struct RunTimeProbeModel : RunTimeProbeBase {
  const std::string &getTypeName() const override { return WAVEMILL_TYPE_NAME(); }
  std::string getFullTypeName() const override { return WAVEMILL_FULL_TYPE_NAME(); }
};

struct RunTimeProbePair {};

template <class T> struct RunTimeProbeCollection : RunTimeProbeBase {
  const std::string &getTypeName() const override { return WAVEMILL_TYPE_NAME(); }
  virtual std::string getFullTypeName() const override { return WAVEMILL_FULL_TYPE_NAME(); }
};

namespace Deep::Deeper {
struct RunTimeProbeInner {
  static std::string getFullTypeName() { return WAVEMILL_FULL_TYPE_NAME(); }
};
} // namespace Deep::Deeper

} // namespace Corvane::Wavemill

// The class keyword in front of a template argument is dropped; the
// templates without one are named by the macros below.
TEST(RunTimeTest, MicrosoftSignaturesGiveFullAndShortNames) {
  const std::string signature =
      "class std::basic_string<char,struct std::char_traits<char>,class std::allocator<char> > __cdecl "
      "Corvane::Wavemill::ModelCollection<class Corvane::Wavemill::TextPair>::getFullTypeName(void) const";
  const int size = static_cast<int>(signature.size()) + 1;
  EXPECT_EQ(RunTime::doGetFullTypeName(signature.c_str(), size),
            "Corvane::Wavemill::ModelCollection`1[[Corvane::Wavemill::TextPair]]");
  EXPECT_EQ(RunTime::doGetTypeName(signature.c_str(), size), "ModelCollection`1[[TextPair]]");
}

TEST(RunTimeTest, TextWithoutClassGivesEmptyNames) {
  // A size that ends the text before its last "::" hides the class.
  for (auto [text, size] : {std::pair<const char *, int>{"", 1}, {nullptr, 0}, {"void A::f(void)", 3}}) {
    SCOPED_TRACE(text ? text : "null");
    EXPECT_EQ(RunTime::doGetFullTypeName(text, size), "");
    EXPECT_EQ(RunTime::doGetTypeName(text, size), "");
  }
  EXPECT_EQ(RunTime::fullTypeNameOf(""), "");
  EXPECT_EQ(RunTime::typeNameOf(nullptr), "");
}

TEST(RunTimeTest, LastIndexOfSearchesDownFromStartAndStaysInsideText) {
  // Searching "a:b:c" from a start index (5 is the terminator's); a start
  // past the end is read as the end, not as memory behind the text.
  const struct {
    char wanted;
    int start, found;
  } rows[] = {{':', 5, 3},  {':', 3, 3},  {':', 2, 1},   {'a', 4, 0},
              {':', 0, -1}, {'x', 5, -1}, {':', -1, -1}, {':', 1000, 3}};
  for (const auto &row : rows)
    EXPECT_EQ(RunTime::lastIndexOf("a:b:c", row.wanted, row.start), row.found) << row.wanted << " from " << row.start;
  EXPECT_EQ(RunTime::lastIndexOf("", '\0', 0), -1);
  EXPECT_EQ(RunTime::lastIndexOf(nullptr, ':', 0), -1);
}

TEST(RunTimeTest, ShortClassNameTakesTextBehindLastColonElseLastInnerBlank) {
  // A blank that ends the name is not the one in front of the class, and
  // neither a colon nor a blank at the very start separates anything.
  const std::pair<const char *, const char *> rows[] = {{"class Corvane::Wavemill::TextPair", "TextPair"},
                                                        {"class TextPair", "TextPair"},
                                                        {"int", "int"},
                                                        {"", ""},
                                                        {"class Foo> ", "Foo> "},
                                                        {":Foo", ":Foo"},
                                                        {" Foo", " Foo"}};
  for (const auto &[text, brief] : rows)
    EXPECT_EQ(RunTime::getShortClassName(text), brief) << text;
}

TEST(RunTimeTest, AdaptSignatureRewritesGccMemberText) {
  // Several parameters, values with their own commas and templates, a
  // parameter named like the namespace in front of it, a pack, a character.
  const std::pair<const char *, const char *> cases[] = {
      {"virtual std::string Corvane::Wavemill::TextModel::getFullTypeName() const",
       "std::string Corvane::Wavemill::TextModel::getFullTypeName(void) const"},
      {"std::string Corvane::Wavemill::ModelCollection<T>::getFullTypeName() const [with T = "
       "Corvane::Wavemill::TextPair; std::string = std::__cxx11::basic_string<char>]",
       "std::string Corvane::Wavemill::ModelCollection<Corvane::Wavemill::TextPair>::getFullTypeName(void) const"},
      {"static const std::string& Plain::name(int, const char*)", "const std::string& Plain::name(void)"},
      {"void N::Pair<K, N>::f() const [with K = std::map<int, std::vector<char> >; int N = 2]",
       "void N::Pair<std::map<int, std::vector<char> >, 2>::f(void) const"},
      {"void Box<T>::f() && [with T = Box<int>]", "void Box<Box<int> >::f(void) &&"},
      {"void Tuple<Ts>::f() [with Ts = {int, char}]", "void Tuple<int, char>::f(void)"},
      {"void Ch<C>::f() const [with char C = ';']", "void Ch<';'>::f(void) const"},
      {"void A::operator()(std::function<void(int)>) const", "void A::operator()(void) const"},
  };
  for (const auto &[pretty, expected] : cases)
    EXPECT_EQ(RunTime::adaptSignature(pretty), expected) << pretty;
}

TEST(RunTimeTest, MacrosNameTheClassOfTheEnclosingMember) {
  using namespace Corvane::Wavemill;
  const RunTimeProbeModel model;
  const RunTimeProbeBase &asBase = model;
  const RunTimeProbeCollection<RunTimeProbePair> pairs;
  const RunTimeProbePlain plain;
  const std::pair<std::string, std::string> rows[] = {
      {asBase.getTypeName(), "RunTimeProbeModel"},
      {asBase.getFullTypeName(), "Corvane.Wavemill.RunTimeProbeModel"},
      {pairs.getTypeName(), "RunTimeProbeCollection`1[[RunTimeProbePair]]"},
      {pairs.getFullTypeName(), "Corvane::Wavemill::RunTimeProbeCollection`1[[Corvane::Wavemill::RunTimeProbePair]]"},
      {plain.getTypeName(), "RunTimeProbePlain"},
      {plain.getFullTypeName(), "RunTimeProbePlain"},
      {Deep::Deeper::RunTimeProbeInner::getFullTypeName(), "Corvane.Wavemill.Deep.Deeper.RunTimeProbeInner"}};
  for (const auto &[actual, expected] : rows)
    EXPECT_EQ(actual, expected);

  // The compiler's own text of a nested collection ends in the same odd
  // names as the signature form.
  const RunTimeProbeCollection<RunTimeProbeCollection<RunTimeProbePair>> nested;
  EXPECT_EQ(nested.getTypeName(), "RunTimeProbeCollection`1[[RunTimeProbePair> ]]");
  EXPECT_EQ(nested.getFullTypeName(), ">");
}
