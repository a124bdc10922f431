#include "wavemill/waveform/DynamicBuffer.h"

#include <gtest/gtest.h>

#include <numeric>
#include <vector>

using namespace Corvane::Wavemill;

TEST(DynamicBufferTest, PiecesNeverStraddleABlockAndCopyToSkipsTheGaps) {
  std::vector<unsigned char> source(9);
  std::iota(source.begin(), source.end(), 1);
  DynamicBuffer buffer(4);
  const struct {
    int length;
    int result;
    int size;
  } appends[] = {
      {3, 3, 3}, // block 1: 1 2 3
      {1, 1, 4}, // fills block 1 exactly
      {1, 1, 5}, // block 2
      {4, 4, 9}, // a whole block into a part-filled one: block 3, gap of 3 in block 2
      {5, 0, 9}, // longer than a block: refused
      {-1, 0, 9}, {0, 0, 9},
  };
  int from = 0;
  for (const auto &row : appends) {
    SCOPED_TRACE(row.length);
    EXPECT_EQ(buffer.append(source.data() + from, row.length), row.result);
    EXPECT_EQ(buffer.size(), row.size);
    from += row.result;
  }
  std::vector<unsigned char> out(12, 0xEE);
  EXPECT_EQ(buffer.copyTo(out.data()), 9);
  EXPECT_EQ(std::vector<unsigned char>(out.begin(), out.begin() + 9), source);
  EXPECT_EQ(out[9], 0xEE);

  buffer.reset();
  EXPECT_EQ(buffer.size(), 0);
  EXPECT_EQ(buffer.append(source.data(), 4), 4);
  EXPECT_EQ(buffer.copyTo(out.data()), 4);
}

TEST(DynamicBufferTest, ALongChainIsFreedWithoutRecursion) {
  // A million one-byte blocks: freeing them by recursion would overflow
  // the stack, more so under the sanitizers.
  DynamicBuffer buffer(1);
  unsigned char byte = 7;
  for (int i = 0; i < 1000000; ++i) {
    ASSERT_EQ(buffer.append(&byte, 1), 1);
  }
  EXPECT_EQ(buffer.size(), 1000000);
  buffer.reset();
  EXPECT_EQ(buffer.size(), 0);
}
