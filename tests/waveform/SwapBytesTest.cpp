#include "wavemill/waveform/SwapBytes.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;

// Every overload hands its bytes to the one reversing loop.
TEST(SwapBytesTest, OverloadsReverseTheBytesOfTheirWidth) {
  EXPECT_EQ(swapBytes::doit(static_cast<unsigned short>(0x1234)), 0x3412);
  EXPECT_EQ(swapBytes::doit(0x89ABCDEFu), 0xEFCDAB89u);
}
