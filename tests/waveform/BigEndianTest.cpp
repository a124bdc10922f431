#include "wavemill/waveform/BigEndian.h"
#include "wavemill/waveform/SwapBytes.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using Bytes = std::vector<unsigned char>;

// The widths and their byte order: the waveform header tests hold every
// type against tabled bytes and read each back.
TEST(BigEndianTest, MakeBlockStoresTheContentLengthInEightBits) {
  const auto mixed = BigEndian::makeBlock(7, static_cast<unsigned char>(1), static_cast<unsigned short>(0x0203),
                                          std::string("x\0y", 3));
  EXPECT_EQ(*mixed, (Bytes{7, 6, 0x01, 0x02, 0x03, 'x', 0x00, 'y'})); // a string has no length and no terminator
  const auto longBlock = BigEndian::makeBlock(7, std::string(300, 'a'));
  ASSERT_EQ(longBlock->size(), 302u);
  EXPECT_EQ((*longBlock)[1], 300 - 256);
}

TEST(BigEndianTest, ParseTakesTextFieldsOnlyWhereTheyFitAndRaisesOnHugeSpans) {
  // Numbers that do not fit keep their value: the waveform header tests
  // read short and cut blocks.
  unsigned char u = 0;
  int pos = 0;
  Bytes text{'a', 0, 'b', 'c', 'd'};
  const struct {
    const char *name;
    std::string before;
    int start;
    std::string after;
    int end;
  } strings[] = {
      {"fixed field inside the span, zero as space", "....", 0, "a bc", 4},
      {"fixed field ending at the end of the span", "...", 2, "...", 2},
      {"trailing field takes the rest, position stays", "", 2, "bcd", 2},
      {"negative position", "", -1, "", -1},
  };
  for (const auto &row : strings) {
    SCOPED_TRACE(row.name);
    std::string value = row.before;
    pos = row.start;
    BigEndian::parse(gsl::make_span(text), &pos, &value);
    EXPECT_EQ(value, row.after);
    EXPECT_EQ(pos, row.end);
  }
  unsigned char one = 0;
  const gsl::span<unsigned char> huge(&one, static_cast<std::size_t>(INT_MAX) + 1);
  EXPECT_THROW(BigEndian::parse(huge, &pos, &u), gsl::narrowing_error);
}

TEST(BigEndianTest, ParseBlockSkipsWholeBlocksAndNeverReadsPastTheSpan) {
  const struct {
    const char *name;
    Bytes input;
    int start;
    int result;
    double value;
    int end;
  } rows[] = {
      {"longer block: extra bytes skipped", {9, 0x3F, 0xF0, 0, 0, 0, 0, 0, 0, 0xAA, 0xBB}, 0, 9, 1.0, 10},
      {"short block: value kept", {4, 0x3F, 0xF0, 0, 0, 0xEE}, 0, 4, 7.0, 5},
      {"size claims more than is there", {200, 0x3F, 0xF0, 0, 0, 0, 0, 0, 0}, 0, 200, 1.0, 201},
      {"position at the end", {8}, 1, 0, 7.0, 1},
      {"negative position", {8}, -3, 0, 7.0, -3},
  };
  for (auto row : rows) {
    SCOPED_TRACE(row.name);
    double value = 7.0;
    int pos = row.start;
    EXPECT_EQ(BigEndian::parseBlock(gsl::make_span(row.input), &pos, &value), row.result);
    EXPECT_EQ(value, row.value);
    EXPECT_EQ(pos, row.end);
  }
}

// Every overload hands its bytes to the one reversing loop.
TEST(SwapBytesTest, OverloadsReverseTheBytesOfTheirWidth) {
  EXPECT_EQ(swapBytes::doit(static_cast<unsigned short>(0x1234)), 0x3412);
  EXPECT_EQ(swapBytes::doit(0x89ABCDEFu), 0xEFCDAB89u);
}
