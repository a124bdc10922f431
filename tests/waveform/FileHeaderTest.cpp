#include "wavemill/waveform/ArbFileHeader.h"
#include "wavemill/waveform/FlexibleArbFileHeader.h"
#include "wavemill/waveform/HdrDescript.h"

#include "support/HeaderStreams.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;
using Bytes = std::vector<unsigned char>;

namespace {

Bytes operator+(Bytes a, const Bytes &b) {
  a.insert(a.end(), b.begin(), b.end());
  return a;
}

// Doubles -1.0 are BFF0000000000000 and 9e99 is 54B075823B6C498A; floats
// -1.0 are BF800000 and about 1e37 is 7CF0BDC2.
Bytes arbDefaults() {
  return hex("00000000 00000000 0003 00000000 0000") + Bytes(32, 0) +
         hex("BFF0000000000000 FFFFFFFFFFFFFFFF BFF0000000000000 BFF0000000000000 "
             "BF800000 BF800000 BF800000 BF800000 FFFF FF00 FFFF 0000");
}
Bytes flexibleBase() { return hex("00000000 FFFF0001 0003 00000000 0000"); }
Bytes flexibleBlock1() {
  return hex("01 76") + Bytes(32, 0) +
         hex("BFF0000000000000 FFFFFFFFFFFFFF BFF0000000000000 BFF0000000000000 BF800000 FF00 "
             "54B075823B6C498A FF 7CF0BDC2 BFF0000000000000 BFF0000000000000 BFF0000000000000 FFFF FF "
             "BFF0000000000000 FF");
}
Bytes flexibleBlock3() { return hex("03 19 BF800000 FF BFF0000000000000 BFF0000000000000 7CF0BDC2"); }
Bytes flexibleBlock10() { return hex("0A 06 FF BF800000 00"); }
Bytes flexibleDefaults() {
  return flexibleBase() + flexibleBlock1() + flexibleBlock3() + flexibleBlock10() + hex("0000");
}

Bytes tagBytes(const FileHeader &header, FileHeader::Tag tag) {
  char out[256];
  const int n = header.readBuffer(out, 256, tag);
  return Bytes(out, out + n);
}

} // namespace

TEST(FileHeaderTest, NewHeadersSerializeTheirDefaultsByteForByteAndReadBack) {
  const struct {
    const char *name;
    std::unique_ptr<FileHeader> (*make)();
    Bytes expected;
  } rows[] = {
      {"fixed", [] { return std::unique_ptr<FileHeader>(ArbFileHeader::build()); }, arbDefaults()},
      {"flexible", [] { return std::unique_ptr<FileHeader>(FlexibleArbFileHeader::build()); }, flexibleDefaults()},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    const auto header = row.make();
    EXPECT_EQ(written(*header), row.expected);
    EXPECT_EQ(header->getCurrentHeaderSize(), static_cast<int>(row.expected.size()));

    ItemWriter unchanged;
    EXPECT_TRUE(header->write(&unchanged)); // nothing changed: nothing written
    EXPECT_TRUE(unchanged.bytes().empty());

    const auto back = row.make();
    ItemReader reader(row.expected);
    EXPECT_TRUE(back->read(&reader));
    EXPECT_EQ(written(*back), row.expected);
  }
}

TEST(FileHeaderTest, WriteBufferClipsToTheFieldAndVariableFieldsSetTheirBlock) {
  const std::string text(300, 'v');
  const struct {
    const char *name;
    FileHeader::Tag tag;
    int length;
    int stored;
    int headerSize;
  } rows[] = {
      {"fixed field takes its length", FileHeader::Tag6, 10, 8, 173},
      {"variable field stops at byte 255 of its block", FileHeader::Tag44, 300, 249, 173 + 249},
      {"variable field sets the block's length", FileHeader::Tag44, 3, 3, 176},
      {"a first variable field adds its block", FileHeader::Tag39, 5, 5, 173 + 2 + 5},
      {"an empty variable field adds nothing", FileHeader::Tag45, 0, 0, 173},
      {"unregistered tag", FileHeader::Tag14, 1, 0, 173},
      {"tag past the table", static_cast<FileHeader::Tag>(50), 1, 0, 173},
      {"negative length", FileHeader::Tag6, -1, 0, 173},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    FlexibleArbFileHeader header;
    header.clear();
    header.writeBuffer(FileHeader::Tag44, text.data(), 100); // shortened again by the rows that write it
    EXPECT_EQ(header.writeBuffer(row.tag, text.data(), row.length), row.stored);
    if (row.tag != FileHeader::Tag44) {
      header.writeBuffer(FileHeader::Tag44, text.data(), 0);
    }
    EXPECT_EQ(header.getCurrentHeaderSize(), row.headerSize);
  }

  FlexibleArbFileHeader header;
  header.clear();
  header.writeBuffer(FileHeader::Tag44, "abcdef", 6);
  header.writeBuffer(FileHeader::Tag44, "xyz", 3);
  EXPECT_EQ(tagBytes(header, FileHeader::Tag44), (Bytes{'x', 'y', 'z'}));
  const Bytes bytes = written(header);
  EXPECT_EQ(Bytes(bytes.end() - 13, bytes.end()), hex("0A 09 FF BF800000 00 78797A 0000")); // "xyz"
}

TEST(FileHeaderTest, ReadRefusesDamagedStreamsAndKeepsWhatOlderShorterBlocksLack) {
  const Bytes end{0, 0};
  const Bytes block1 = flexibleBlock1();
  const Bytes shortBlock1(block1.begin(), block1.begin() + 2 + 100);
  Bytes olderBlock1 = shortBlock1;
  olderBlock1[1] = 100;
  Bytes otherId = flexibleDefaults();
  otherId[7] = 0x02;
  const struct {
    const char *name;
    Bytes input;
    bool result;
  } rows[] = {
      {"no terminator", flexibleBase() + flexibleBlock1() + flexibleBlock3(), true},
      {"older, shorter block 1", flexibleBase() + olderBlock1 + end, true},
      {"block 3 twice", flexibleBase() + flexibleBlock1() + flexibleBlock3() + hex("03 05 0102030405") + end, false},
      {"id 0 with a size", flexibleBase() + hex("00 05"), false},
      {"content cut short", flexibleBase() + shortBlock1, false},
      {"base block cut short", Bytes(15, 0), false},
      {"another header id", otherId, false},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    FlexibleArbFileHeader header;
    ItemReader reader(row.input);
    EXPECT_EQ(header.read(&reader), row.result);
    ItemWriter writer;
    EXPECT_EQ(header.write(&writer), row.result); // an invalid header is not written
    if (row.result) {
      EXPECT_EQ(tagBytes(header, FileHeader::Tag34), Bytes{0xFF}); // behind a short block 1: the default
    }
  }
}

TEST(FileHeaderTest, CopyKeepsItsOwnIdAndTakesTheFieldsBothLayoutsShare) {
  ArbFileHeader arb;
  arb.clear();
  arb.writeValue<double>(FileHeader::Tag6, -2.5);
  arb.writeBuffer(FileHeader::Tag14, "\x07", 1);
  arb.writeBuffer(FileHeader::TagMagic, "\x87\x86\x85\x84", 4);

  const std::unique_ptr<FileHeader> flexible(FlexibleArbFileHeader::copy(arb));
  ASSERT_NE(flexible, nullptr);
  EXPECT_EQ(tagBytes(*flexible, FileHeader::Tag6), (Bytes{0xC0, 0x04, 0, 0, 0, 0, 0, 0}));
  EXPECT_EQ(tagBytes(*flexible, FileHeader::TagMagic), (Bytes{0x87, 0x86, 0x85, 0x84}));
  EXPECT_EQ(tagBytes(*flexible, FileHeader::TagHeaderId), (Bytes{0xFF, 0xFF, 0x00, 0x01}));
  EXPECT_EQ(written(*flexible).size(), 173u);

  const std::unique_ptr<FileHeader> same(ArbFileHeader::copy(arb));
  ASSERT_NE(same, nullptr);
  EXPECT_EQ(written(*same), written(arb));
  EXPECT_EQ(tagBytes(*same, FileHeader::Tag14), Bytes{0x07});
}

TEST(HdrDescriptTest, DescriptorLayoutDropsTheLastTextCharacterAndBiasesTheResolution) {
  hdrDescript built("ABCDEFGHIJKLMNOPQRSTUVWXYZ", DataRes4, -2.5);
  Bytes descriptor(32);
  built.getDescript(descriptor.data());
  // "A" to "V", a zero, the resolution 4 + 202, and -2.5 as a big-endian double.
  EXPECT_EQ(descriptor, hex("4142434445464748494A4B4C4D4E4F5051525354555600 CE C004000000000000"));
  char text[23];
  built.getText(text);
  EXPECT_EQ(std::string(text, 23), "ABCDEFGHIJKLMNOPQRSTUVW");

  hdrDescript back(descriptor.data());
  EXPECT_EQ(back.getFreq(), -2.5);
  back.getText(text);
  EXPECT_EQ(std::string(text, 23), std::string("ABCDEFGHIJKLMNOPQRSTUV") + '\0');

  const struct {
    unsigned char stored;
    DataRes res;
  } codes[] = {{202, DataResNone}, {203, DataRes1}, {204, DataRes2}, {205, DataResNone}, {206, DataRes4}};
  for (const auto &row : codes) {
    SCOPED_TRACE(static_cast<int>(row.stored));
    descriptor[23] = row.stored;
    EXPECT_EQ(hdrDescript(descriptor.data()).getRes(), row.res);
  }
}
