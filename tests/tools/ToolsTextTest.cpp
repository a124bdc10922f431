#include "wavemill/tools/Tools.h"

#include "support/ExpectThrow.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::Testing::thrown;

namespace {

using Pieces = std::vector<std::string>;
using Text = std::pair<std::string, std::string>;

} // namespace

TEST(ToolsTest, SplitKeepsLeadingAndInnerEmptyPiecesTrimOnlyTheEndsAndReplaceNeverRescans) {
  const std::pair<const char *, Pieces> splits[] = {
      {"", {""}}, {",", {""}}, {"a,b,", {"a", "b"}}, {",a", {"", "a"}}, {"a;b,,c", {"a", "b", "", "c"}}};
  for (const auto &[text, pieces] : splits)
    EXPECT_EQ(Tools::split(text, ",;"), pieces) << text;
  EXPECT_EQ(Tools::splitTrim("\"x\" ;\t y", ";", " \t\""), (Pieces{"x", "y"}));
  // Trimming removes members of the set only at the chosen ends.
  const Text trimmed[] = {{Tools::trim("   ", ' '), ""},
                          {Tools::trim(" a ", ""), " a "},
                          {Tools::trim("xyaxby", "xy"), "axb"},
                          {Tools::trimStart("--a--", '-'), "a--"},
                          {Tools::trimEnd("--a--", "-"), "--a"}};
  // Replacing goes left to right without rescanning what it put in.
  const Text replaced[] = {{Tools::replace("aaa", "aa", "b"), "ba"},
                           {Tools::replace("abc", "b", "bb"), "abbc"},
                           {Tools::replace("x", "", "y"), "x"}};
  for (const auto &rows : {gsl::span<const Text>(trimmed), gsl::span<const Text>(replaced)})
    for (const auto &[result, expected] : rows)
      EXPECT_EQ(result, expected);
}

TEST(ToolsTest, CaseQuotingJoiningAndFilteringWorkOnBytes) {
  EXPECT_TRUE(Tools::compareIgnoreCase("Abc1", "aBC1"));
  EXPECT_FALSE(Tools::compareIgnoreCase("abc", "abcd"));
  EXPECT_EQ(Tools::toUpper("aZ1\xe9"), "AZ1\xe9");
  EXPECT_EQ(Tools::q("a\"b"), "\"a\"b\"");
  for (const auto &[text, unquoted] : {Text{"\"", "\""}, Text{"\"abc'", "abc"}, Text{"a'", "a'"}, Text{"'a", "'a"}})
    EXPECT_EQ(Tools::removeQuot(text), unquoted) << text;
  EXPECT_EQ(Tools::formatString("1a2.b", "0123456789."), "12.");
  EXPECT_EQ(Tools::join(std::vector<std::string>{"a", "b", "c"}, ", "), "a, b, c");
  std::string target = "x";
  Tools::append(target, "yz\0w", 4);
  Tools::append(target, "ignored", -1);
  EXPECT_EQ(target, std::string("xyz\0w", 5));
}

TEST(ToolsTest, PadLeftClipKeepsTheRightHandEndAtExactlyTheLengthAndBitStringsTakeOnlyZerosAndOnes) {
  std::string digits = "12345";
  for (const auto &[length, padded] : {std::pair<std::uint64_t, const char *>{3, "345"}, {5, "12345"}, {7, "0012345"}})
    EXPECT_EQ(Tools::padLeftClip(digits, length), padded) << length;
  EXPECT_EQ(digits, "12345");
  EXPECT_EQ(thrown([&] { Tools::padLeftClip(digits, UINT64_MAX); }), "invalid_argument: length");

  EXPECT_EQ(Tools::formatBitsWithLength("x1111", 2), "10");
  EXPECT_EQ(Tools::formatBitsWithLength("1", -3), "");
  EXPECT_EQ(Tools::uint32ToOneZeroString(5, 4), "0101");
  EXPECT_EQ(Tools::uint32ToOneZeroString(0x80000005U, 40), "10000000000000000000000000000101");
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
