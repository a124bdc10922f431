#include "wavemill/tools/Tools.h"

#include "support/ExpectThrow.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::Testing::thrown;

namespace {

using Pieces = std::vector<std::string>;

} // namespace

TEST(ToolsTest, SplitKeepsLeadingAndInnerEmptyPiecesTrimOnlyTheEndsAndReplaceNeverRescans) {
  EXPECT_EQ(Tools::split("", ','), Pieces{""});
  EXPECT_EQ(Tools::split(",", ','), Pieces{""});
  EXPECT_EQ(Tools::split("a,b,", ','), (Pieces{"a", "b"}));
  EXPECT_EQ(Tools::split(",a", ','), (Pieces{"", "a"}));
  EXPECT_EQ(Tools::split("a,,b", ','), (Pieces{"a", "", "b"}));
  EXPECT_EQ(Tools::split("a;b,c", ",;"), (Pieces{"a", "b", "c"}));
  EXPECT_EQ(Tools::splitTrim(" a , b ,", ',', ' '), (Pieces{"a", "b"}));
  EXPECT_EQ(Tools::splitTrim("\"x\" ;\t y", ";", " \t\""), (Pieces{"x", "y"}));
  // Trimming removes members of the set only at the chosen ends.
  EXPECT_EQ(Tools::trim("   ", ' '), "");
  EXPECT_EQ(Tools::trim(" a ", ""), " a ");
  EXPECT_EQ(Tools::trim("xyaxby", "xy"), "axb");
  EXPECT_EQ(Tools::trimStart("--a--", '-'), "a--");
  EXPECT_EQ(Tools::trimEnd("--a--", "-"), "--a");
  // Replacing goes left to right without rescanning what it put in.
  EXPECT_EQ(Tools::replace("aaa", "aa", "b"), "ba");
  EXPECT_EQ(Tools::replace("abc", "b", "bb"), "abbc");
  EXPECT_EQ(Tools::replace("aXbX", "X", ""), "ab");
  EXPECT_EQ(Tools::replace("x", "", "y"), "x");
}

TEST(ToolsTest, CaseQuotingJoiningAndFilteringWorkOnBytes) {
  EXPECT_TRUE(Tools::compareIgnoreCase("Abc1", "aBC1"));
  EXPECT_TRUE(Tools::compareIgnoreCase("", ""));
  EXPECT_FALSE(Tools::compareIgnoreCase("abc", "abcd"));
  EXPECT_EQ(Tools::toUpper("aZ1\xe9"), "AZ1\xe9");
  EXPECT_EQ(Tools::q("a\"b"), "\"a\"b\"");
  EXPECT_EQ(Tools::removeQuot("\""), "\"");
  EXPECT_EQ(Tools::removeQuot("\"abc'"), "abc");
  EXPECT_EQ(Tools::removeQuot("a'"), "a'");
  EXPECT_EQ(Tools::formatString("1a2.b", "0123456789."), "12.");
  const std::vector<std::string> parts{"a", "b", "c"};
  EXPECT_EQ(Tools::join(parts, ", "), "a, b, c");
  EXPECT_EQ(Tools::join(gsl::span<const std::string>(parts).first(1), ", "), "a");
  EXPECT_EQ(Tools::join({}, ", "), "");
  std::string target = "x";
  Tools::append(target, "yz\0w", 4);
  Tools::append(target, "ignored", -1);
  EXPECT_EQ(target, std::string("xyz\0w", 5));
}

TEST(ToolsTest, PadLeftClipKeepsTheRightHandEndAtExactlyTheLengthAndBitStringsTakeOnlyZerosAndOnes) {
  std::string digits = "12345", one = "7";
  EXPECT_EQ(Tools::padLeftClip(digits, 3), "345");
  EXPECT_EQ(digits, "12345");
  EXPECT_EQ(Tools::padLeftClip(one, 3), "007");
  EXPECT_EQ(Tools::padLeftClip(one, 0), "");
  EXPECT_EQ(thrown([&] { Tools::padLeftClip(one, UINT64_MAX); }), "invalid_argument: length");

  EXPECT_EQ(Tools::formatBitsWithLength("x1", 2), "10");
  EXPECT_EQ(Tools::formatBitsWithLength("x1111", 2), "10");
  EXPECT_EQ(Tools::formatBitsWithLength("1", -3), "");
  EXPECT_EQ(Tools::uint32ToOneZeroString(5, 4), "0101");
  EXPECT_EQ(Tools::uint32ToOneZeroString(0x80000005U, 40), "10000000000000000000000000000101");
  EXPECT_EQ(Tools::uint32ToOneZeroString(5, 0), "");
  EXPECT_EQ(Tools::bitsToOneZeroString(std::vector<unsigned char>{0, 1, 2, 1}), "011");
  EXPECT_EQ(Tools::oneZeroStringToBits("101"), (std::vector<unsigned char>{1, 0, 1}));
  EXPECT_EQ(thrown([] { Tools::oneZeroStringToBits("10 1"); }), "invalid_argument: input");
}

TEST(ToolsTest, EnumerationItemsGoByClampedIndexFirstWordAndWholeItemOrListTail) {
  EXPECT_EQ(Tools::enumIndexToText("A, B", 5), "B");
  EXPECT_EQ(Tools::enumIndexToText("A, B", -1), "A");
  EXPECT_EQ(Tools::enumIndexToText("Alpha Beta, Gamma", 0), "Alpha");
  EXPECT_EQ(Tools::enumIndexToText("A,, B", 1), "B");
  EXPECT_EQ(Tools::enumIndexToText("", 3), "");
  EXPECT_EQ(Tools::enumIndexToText(std::string(300, 'x'), 0).size(), 255U);

  EXPECT_EQ(Tools::textToEnumIndex("Alpha, Beta", "Gamma"), -1);
  EXPECT_EQ(Tools::textToEnumIndex("Alpha, Beta", "Alpha"), 0);
  EXPECT_EQ(Tools::textToEnumIndex("Alpha, Beta", "Beta"), 1);
  EXPECT_EQ(Tools::textToEnumIndex("Alpha, Beta", "eta"), 1);
  EXPECT_EQ(Tools::textToEnumIndex("Alpha, Beta", "lph"), -1);
  EXPECT_EQ(Tools::textToEnumIndex("Alphabet, Alpha, Gamma", "Alpha"), 1);
  EXPECT_EQ(Tools::textToEnumIndex("Alpha, Beta", ""), -1);
}
