#include "wavemill/waveform/BigEndian.h"
#include "wavemill/waveform/SwapBytes.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using Bytes = std::vector<unsigned char>;

// BigEndian is a header-only template: the header tests hold every type
// against tabled bytes and the header fuzz test runs its parsers over
// damaged input. What is left is the block length and the string layout.
TEST(BigEndianTest, MakeBlockStoresTheContentLengthInEightBits) {
  const auto mixed = BigEndian::makeBlock(7, static_cast<unsigned char>(1), static_cast<unsigned short>(0x0203),
                                          std::string("x\0y", 3));
  EXPECT_EQ(*mixed, (Bytes{7, 6, 0x01, 0x02, 0x03, 'x', 0x00, 'y'})); // a string has no length and no terminator
  const auto longBlock = BigEndian::makeBlock(7, std::string(300, 'a'));
  ASSERT_EQ(longBlock->size(), 302u);
  EXPECT_EQ((*longBlock)[1], 300 - 256);
}

// Every overload hands its bytes to the one reversing loop.
TEST(SwapBytesTest, OverloadsReverseTheBytesOfTheirWidth) {
  EXPECT_EQ(swapBytes::doit(static_cast<unsigned short>(0x1234)), 0x3412);
  EXPECT_EQ(swapBytes::doit(0x89ABCDEFu), 0xEFCDAB89u);
}
