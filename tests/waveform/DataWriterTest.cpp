#include "wavemill/waveform/DataWriter.h"

#include "support/HeaderStreams.h"

#include <gtest/gtest.h>

#include <vector>

using namespace Corvane::Wavemill;

TEST(BufferDataWriterTest, WritesWholePiecesAndReportsItemsOrZero) {
  Testing::ItemWriter writer;
  const unsigned char bytes[8] = {1, 2, 3, 4, 5, 6, 7, 8};
  EXPECT_EQ(writer.write(bytes, 2, 3), 3); // items, not bytes
  EXPECT_EQ(writer.write(bytes, 1025, 1), 0);
  EXPECT_EQ(writer.write(bytes, -1, 4), 0);
  EXPECT_EQ(writer.size(), 6);
  EXPECT_EQ(writer.bytes(), (std::vector<unsigned char>{1, 2, 3, 4, 5, 6}));
  writer.reset();
  EXPECT_EQ(writer.size(), 0);
}
