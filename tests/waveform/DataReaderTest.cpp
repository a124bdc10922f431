#include "wavemill/waveform/DataReader.h"

#include "support/HeaderStreams.h"

#include <gtest/gtest.h>

#include <numeric>
#include <vector>

using namespace Corvane::Wavemill;

TEST(BufferDataReaderTest, ReadCountsBytesAndStopsAtTheEnd) {
  std::vector<unsigned char> source(5);
  std::iota(source.begin(), source.end(), 1);
  Buffer_DataReader reader(source.data(), 5);
  unsigned char out[8] = {};
  EXPECT_EQ(reader.read(out, 2, 1), 2);
  EXPECT_EQ(reader.read(out, 1, 2), 2); // bytes, not items
  EXPECT_EQ(reader.read(out, 4, 1), 1); // only what is left
  EXPECT_EQ(out[0], 5);
  EXPECT_EQ(reader.read(out, 4, 1), 0);
  reader.reset();
  EXPECT_EQ(reader.read(out, -1, 3), 0);
  EXPECT_EQ(reader.read(out, 8, 1), 5);

  Buffer_DataReader empty(nullptr, 5);
  EXPECT_FALSE(empty.isValid());
  EXPECT_EQ(empty.size(), 0);
  EXPECT_EQ(empty.read(out, 1, 1), 0);
}

TEST(HeaderBufferDataReaderTest, HidesTheFirstSixteenBytesOnlyWhenMoreFollow) {
  std::vector<unsigned char> source(20);
  std::iota(source.begin(), source.end(), 0);
  const struct {
    int length;
    int64_t size;
    int firstByte;
    int readable;
  } rows[] = {
      {17, 1, 16, 1}, {16, 0, 0, 16}, // exactly the base block: read from 0, size 0
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.length);
    HeaderBuffer_DataReader reader(source.data(), row.length);
    EXPECT_EQ(reader.size(), row.size);
    unsigned char out[32] = {};
    EXPECT_EQ(reader.read(out, 32, 1), row.readable);
    EXPECT_EQ(out[0], row.firstByte);
    reader.reset(); // back to byte 16; a short buffer stays at its end
    EXPECT_EQ(reader.read(out, 32, 1), row.length > 16 ? row.readable : 0);
  }
  HeaderBuffer_DataReader invalid(nullptr, 40);
  EXPECT_EQ(invalid.size(), 0);
}

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
