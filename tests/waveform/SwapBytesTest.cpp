#include "wavemill/waveform/SwapBytes.h"

#include <gtest/gtest.h>

#include <cstring>

using namespace Corvane::Wavemill;

namespace {
// The value's bytes come out reversed, and a second swap restores them.
template <typename T> bool reversesAndRestores(T value) {
  const T swapped = swapBytes::doit(value), back = swapBytes::doit(swapped);
  unsigned char in[sizeof(T)], out[sizeof(T)];
  std::memcpy(in, &value, sizeof(T));
  std::memcpy(out, &swapped, sizeof(T));
  bool reversed = true;
  for (std::size_t i = 0; i < sizeof(T); ++i) {
    reversed = reversed && out[i] == in[sizeof(T) - 1 - i];
  }
  return reversed && std::memcmp(&back, &value, sizeof(T)) == 0;
}
} // namespace

TEST(SwapBytesTest, EveryOverloadReversesItsBytesAndASecondCallRestoresThem) {
  EXPECT_TRUE(reversesAndRestores<short>(-2));
  EXPECT_TRUE(reversesAndRestores<unsigned short>(0x1234));
  EXPECT_TRUE(reversesAndRestores<int>(-123456789));
  EXPECT_TRUE(reversesAndRestores<unsigned int>(0x89ABCDEFu));
  EXPECT_TRUE(reversesAndRestores<float>(-1.0f));
  EXPECT_TRUE(reversesAndRestores<double>(9e99));
  EXPECT_EQ(swapBytes::doit(static_cast<unsigned short>(0x1234)), 0x3412);
}
