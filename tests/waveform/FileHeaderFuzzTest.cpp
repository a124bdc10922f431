#include "wavemill/waveform/BigEndian.h"
#include "wavemill/waveform/FlexibleArbFileHeader.h"

#include "support/HeaderStreams.h"

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;
using Bytes = std::vector<unsigned char>;

namespace {

// A real header with every kind of block: fixed, variable and empty ones.
Bytes realHeader() {
  FlexibleArbFileHeader header;
  header.clear();
  header.writeBuffer(FileHeader::Tag39, "reserved", 8);
  header.writeBuffer(FileHeader::Tag44, "name", 4);
  header.writeBuffer(FileHeader::Tag45, "comment", 7);
  return written(header);
}

// Reads `input` and checks what any reader must give: a read that succeeds
// yields a header that writes and reads back to the same bytes, and no tag
// reports more than its block can hold. The sanitizers see every read past
// `input`, whose bytes sit in a heap block of their exact size.
void readAndCheck(const Bytes &input) {
  FlexibleArbFileHeader header;
  ItemReader reader(input);
  if (header.read(&reader)) {
    const Bytes first = written(header);
    EXPECT_EQ(static_cast<int>(first.size()), header.getCurrentHeaderSize());
    FlexibleArbFileHeader again;
    ItemReader rereader(first);
    ASSERT_TRUE(again.read(&rereader));
    EXPECT_EQ(written(again), first);
  }
  char out[300];
  for (int i = 0; i < FileHeader::TagCount; ++i) {
    const auto tag = static_cast<FileHeader::Tag>(i);
    EXPECT_EQ(header.readBuffer(out, 300, tag), header.hasTag(tag) ? header.getTagLengthActual(tag) : 0);
  }
  // The decoders over the same bytes, from the start and from a block.
  Bytes copy = input;
  int pos = 0;
  unsigned int word = 0;
  double value = 0;
  std::string tail;
  BigEndian::parse(gsl::make_span(copy), &pos, &word, &word, &value, &tail);
  pos = 16;
  unsigned char id = 0;
  BigEndian::parse(gsl::make_span(copy), &pos, &id);
  BigEndian::parseBlock(gsl::make_span(copy), &pos, &value, &word, &tail);
}

} // namespace

TEST(FileHeaderFuzzTest, DamagedAndTruncatedHeadersNeitherCrashNorReadPastTheirBytes) {
  const Bytes header = realHeader();
  ASSERT_EQ(header.size(), 16u + 120 + 10 + 27 + 12 + 9 + 2);

  for (std::size_t length = 0; length <= header.size(); ++length) {
    SCOPED_TRACE("truncated to " + std::to_string(length));
    readAndCheck(Bytes(header.begin(), header.begin() + static_cast<std::ptrdiff_t>(length)));
  }
  for (std::size_t at = 0; at < header.size(); ++at) {
    for (unsigned char flip : {0x01, 0x02, 0x04, 0x08, 0x10, 0x20, 0x40, 0x80, 0xFF}) {
      SCOPED_TRACE("byte " + std::to_string(at) + " xor " + std::to_string(flip));
      Bytes damaged = header;
      damaged[at] ^= flip;
      readAndCheck(damaged);
    }
  }
  std::mt19937 random(20240611);
  for (int round = 0; round < 3000; ++round) {
    SCOPED_TRACE("random round " + std::to_string(round));
    Bytes noise(18 + random() % 300);
    for (unsigned char &byte : noise) {
      byte = static_cast<unsigned char>(random());
    }
    // Every other round starts like a real header so that the block walk
    // gets past the id check, with sizes that claim more than is there.
    if (round % 2 == 0) {
      std::copy(header.begin(), header.begin() + 16, noise.begin());
      noise[16] = static_cast<unsigned char>(1 + random() % 14);
      noise[17] = 0xFF;
    }
    readAndCheck(noise);
  }
}
