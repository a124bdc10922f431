#include "wavemill/tools/Tools.h"

#include "support/ExpectThrow.h"

#include <gtest/gtest.h>

#include <array>
#include <climits>
#include <clocale>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <string>
#include <utility>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::Testing::thrown;

using Pieces = std::vector<std::string>;
using Text = std::pair<std::string, std::string>;

// Split and join, and replacing with an empty text, are left to the fuzz test.
TEST(ToolsTest, SplitTrimTrimsEachPieceTrimOnlyTheEndsAndReplaceNeverRescans) {
  EXPECT_EQ(Tools::splitTrim("\"x\" ;\t y", ";", " \t\""), (Pieces{"x", "y"}));
  // Trimming removes members of the set only at the chosen ends.
  EXPECT_EQ(Tools::trim("   ", ' '), "");
  EXPECT_EQ(Tools::trim(" a ", ""), " a ");
  EXPECT_EQ(Tools::trim("xyaxby", "xy"), "axb");
  // Replacing goes left to right without rescanning what it put in.
  EXPECT_EQ(Tools::replace("aaa", "aa", "b"), "ba");
  EXPECT_EQ(Tools::replace("abc", "b", "bb"), "abbc");
}

TEST(ToolsTest, CaseAndQuotesWorkOnBytesAndAppendTakesOnlyAPositiveCount) {
  EXPECT_TRUE(Tools::compareIgnoreCase("Abc1", "aBC1"));
  EXPECT_FALSE(Tools::compareIgnoreCase("abc", "abcd"));
  EXPECT_EQ(Tools::toUpper("aZ1\xe9"), "AZ1\xe9");
  for (const auto &[text, unquoted] : {Text{"\"", "\""}, Text{"\"abc'", "abc"}, Text{"a'", "a'"}, Text{"'a", "'a"}})
    EXPECT_EQ(Tools::removeQuot(text), unquoted) << text;
  std::string target = "x";
  Tools::append(target, "yz\0w", 4);
  Tools::append(target, "ignored", -1);
  EXPECT_EQ(target, std::string("xyz\0w", 5));
}

TEST(ToolsTest, PadLeftClipKeepsTheRightHandEndAtExactlyTheLengthAndBitStringsTakeOnlyZerosAndOnes) {
  std::string digits = "12345";
  for (const auto &[length, padded] : {std::pair<std::uint64_t, const char *>{3, "345"}, {5, "12345"}, {7, "0012345"}})
    EXPECT_EQ(Tools::padLeftClip(digits, length), padded) << length;
  EXPECT_EQ(thrown([&] { Tools::padLeftClip(digits, UINT64_MAX); }), "invalid_argument: length");

  EXPECT_EQ(Tools::formatBitsWithLength("x1111", 2), "10");
  EXPECT_EQ(Tools::formatBitsWithLength("1", -3), "");
  EXPECT_EQ(Tools::uint32ToOneZeroString(5, 4), "0101");
  EXPECT_EQ(Tools::bitsToOneZeroString(std::vector<unsigned char>{0, 1, 2, 1}), "011");
  EXPECT_EQ(Tools::oneZeroStringToBits("101"), (std::vector<unsigned char>{1, 0, 1}));
  EXPECT_EQ(thrown([] { Tools::oneZeroStringToBits("10 1"); }), "invalid_argument: input");
}

TEST(ToolsTest, EnumerationItemsGoByClampedIndexFirstWordAndWholeItemOrListTail) {
  const std::pair<int, const char *> items[] = {{5, "B"}, {0, "Alpha"}, {1, "B"}};
  for (const auto &[index, item] : items)
    EXPECT_EQ(Tools::enumIndexToText("Alpha Beta,, B", index), item) << index;
  EXPECT_EQ(Tools::enumIndexToText("", 3), "");
  EXPECT_EQ(Tools::enumIndexToText(std::string(300, 'x'), 0).size(), 255U);

  const std::pair<const char *, int> indexes[] = {{"Gamma", -1}, {"Alphabet", 0}, {"Alpha", 1}, {"eta", 2},
                                                  {"lph", -1},   {"phabet", -1},  {"", -1}};
  for (const auto &[text, index] : indexes)
    EXPECT_EQ(Tools::textToEnumIndex("Alphabet, Alpha, Beta", text), index) << text;
}

TEST(ToolsTest, ParseFunctionsTakeTheLeadingNumberOrAnswerTheDefaultOrLeaveTheValueAlone) {
  EXPECT_EQ(Tools::parseInt32("12345678901", 7), 7);
  EXPECT_EQ(Tools::parseInt32(" 42abc", 7), 42);
  EXPECT_EQ(Tools::parseFloat("0.25", 0), 0.25F);
  EXPECT_EQ(Tools::parseFloat("1e39", 3), 3.0F);

  // tryParse leaves the value alone when it fails.
  int value = 0;
  EXPECT_TRUE(Tools::tryParse("ff", value, 16));
  EXPECT_EQ(value, 255);
  EXPECT_TRUE(Tools::tryParse(" -7x", value, 10));
  EXPECT_EQ(value, -7);
  using Row = std::pair<const char *, int>;
  for (const auto &[text, base] : {Row{"99999999999", 10}, Row{"12", 1}, Row{"12", 37}})
    EXPECT_FALSE(Tools::tryParse(text, value, base)) << text << " in base " << base;
  EXPECT_EQ(value, -7);
}

TEST(ToolsTest, TryParseDoubleRefusesWhatTheFilterRejectsAndPassesConversionFailuresOn) {
  double value = -1;
  for (const char *text : {"", "1e5e3", "e5", "1..2", "+-1", "1-2", ".-1", "1,5", "1e+-3", "1e3-"})
    EXPECT_FALSE(Tools::tryParse(text, value)) << text;
  EXPECT_EQ(value, -1);
  const std::pair<const char *, double> accepted[] = {{"5e", 5}, {"1 2", 1}, {" -1.5E-3", -1.5e-3}};
  for (const auto &[text, number] : accepted) {
    EXPECT_TRUE(Tools::tryParse(text, value)) << text;
    EXPECT_EQ(value, number) << text;
  }
  EXPECT_EQ(thrown([&] { Tools::tryParse("- 1", value); }), "invalid_argument: invalid stod argument");
  EXPECT_EQ(thrown([&] { Tools::tryParse("1e999", value); }), "out_of_range: stod argument out of range");
}

// Each row: value, low, high, step and the result.
TEST(ToolsTest, ClipAndRoundFormsDifferInGridOriginDirectionAndHalves) {
  // The double form takes the nearest multiple of the step counted from zero,
  // within the limits that the float form applies alone.
  // Below low, above high and on the grid are left to the instrument's clip test.
  const std::array<double, 5> reals[] = {{10, 0, 10, 6, 10}, {1, 0.5, 10, 4, 0.5}, {3.3, 0, 10, 0, 3.3}};
  for (const auto &[value, low, high, step, result] : reals)
    EXPECT_EQ(Tools::clip(value, low, high, step), result) << value << " " << low << " " << high << " " << step;
  // The int form rounds up on the grid that starts at low, one step back above high.
  const std::array<int, 5> integers[] = {{5, 1, 10, 4, 5},
                                         {6, 1, 10, 4, 9},
                                         {10, 1, 10, 4, 9},
                                         {0, 1, 10, 4, 1},
                                         {6, 1, 10, -2, 6},
                                         {6, 1, 4, 4, 4},
                                         {INT_MAX, INT_MIN, INT_MAX, INT_MAX, INT_MAX - 1}};
  for (const auto &[value, low, high, step, result] : integers)
    EXPECT_EQ(Tools::clip(value, low, high, step), result) << value << " " << low << " " << high << " " << step;
  // round takes halves away from zero and steps back above high.
  const std::array<double, 5> rounded[] = {
      {10, 0, 10, 4, 8}, {2, 0, 10, 4, 4}, {-2, -10, 10, 4, -4}, {3.3, 0, 2, 5, 2}};
  for (const auto &[value, low, high, step, result] : rounded)
    EXPECT_EQ(Tools::round(value, low, high, step), result) << value << " " << low << " " << high << " " << step;
}

TEST(ToolsTest, ToSingleAvoidsInfinitiesAndDenormals) {
  const std::pair<double, float> rows[] = {{1e39, 1e38F},  {-1e39, -1e38F}, {1e-38, 0.0F},
                                           {-1e-38, 0.0F}, {1e-37, 1e-37F}, {-1e-37, -1e-37F}};
  for (const auto &[value, single] : rows)
    EXPECT_EQ(Tools::toSingle(value), single) << value;
  EXPECT_TRUE(std::isnan(Tools::toSingle(std::numeric_limits<double>::quiet_NaN())));
}

// The conversions take the user's locale from the environment; where that is
// the plain "C" locale, the library's own UTF-8 coding stands in for it.
TEST(ToolsTest, WideTextRoundTripsAsUtf8AndStopsAtTheFirstZero) {
  const char *before = std::getenv("LC_ALL");
  const std::string savedVariable = before == nullptr ? "" : before;
  const std::string savedLocale = std::setlocale(LC_CTYPE, nullptr);
  const std::string narrow = "Gr\xc3\xbc\xc3\x9f"
                             "e";
  for (const char *user : {"C", "C.UTF-8"}) {
    SCOPED_TRACE(user);
    ::setenv("LC_ALL", user, 1);
    EXPECT_EQ(Tools::toWString(narrow), L"Gr\u00fc\u00dfe");
    EXPECT_EQ(Tools::toString(L"Gr\u00fc\u00dfe"), narrow);
    EXPECT_EQ(Tools::toWString("ab\0cd", 5), L"ab");
    EXPECT_EQ(Tools::toString(std::wstring(L"ab\0cd", 5)), "ab");
    EXPECT_EQ(Tools::toWString(nullptr, 3), L"");
    EXPECT_EQ(Tools::toString(L"xyz", 2), "xy");
    EXPECT_EQ(Tools::toWString("ok\xff"), L"");
  }
  before == nullptr ? ::unsetenv("LC_ALL") : ::setenv("LC_ALL", savedVariable.c_str(), 1);
  std::setlocale(LC_CTYPE, savedLocale.c_str());
}
