#include "wavemill/waveform/exportimport/WaveformHeader.h"

#include "support/HeaderStreams.h"

#include <gtest/gtest.h>

#include <functional>
#include <random>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::ExportImport::WaveformHeader;
using Corvane::Wavemill::Testing::hex;
using Bytes = std::vector<unsigned char>;

namespace {

struct Field {
  const char *name;
  std::function<void(WaveformHeader &)> set;
  std::function<bool(const WaveformHeader &, const WaveformHeader &)> same;
};

template <typename T, typename U> Field field(const char *name, T WaveformHeader::*member, U value) {
  return {name, [=](WaveformHeader &h) { h.*member = static_cast<T>(value); },
          [=](const WaveformHeader &a, const WaveformHeader &b) { return a.*member == b.*member; }};
}
#define FIELD(name, value) field(#name, &WaveformHeader::name, value)

// Every field, each set to a value unlike its default and its neighbours.
const std::vector<Field> &fields() {
  // clang-format off
  static const std::vector<Field> all = {
      FIELD(magic, 0x11223344u), FIELD(headerId, 0xFFFF0001u), FIELD(version, 7), FIELD(stamp, 0xA1B2C3D4u),
      FIELD(baseExtra, 0x1234), FIELD(tag5, std::string("abcdefghijklmnopqrstuvwxyz012345")), FIELD(tag6, 1.25),
      FIELD(tag7, 1), FIELD(tag8, 2), FIELD(tag9, 3), FIELD(tag10, 4), FIELD(tag11, 5), FIELD(tag12, 6),
      FIELD(tag13, 7), FIELD(tag15, 2.5), FIELD(tag16, 3.5), FIELD(tag17, 4.5), FIELD(tag22, 0x0102),
      FIELD(tag25, 5.5), FIELD(tag26, 9), FIELD(tag27, 6.5), FIELD(tag28, 7.5), FIELD(tag29, 8.5), FIELD(tag30, 9.5),
      FIELD(tag31, 0x0304), FIELD(tag32, 10), FIELD(tag33, 10.5), FIELD(tag34, 11), FIELD(extension1, 12.5),
      FIELD(extension2, 13.5), FIELD(block2Value, 12), FIELD(reservedText, std::string("opaque")),
      FIELD(tag20, 14.5), FIELD(tag35, 'x'), FIELD(tag36, 15.5), FIELD(tag37, 16.5), FIELD(tag38, 17.5),
      FIELD(block4A, 18.5), FIELD(block4B, 19.5), FIELD(block5Value, 20.5), FIELD(block5Text, std::string("five")),
      FIELD(block6A, 21), FIELD(block6B, 22.5), FIELD(block6C, 0x0506), FIELD(block7A, 23.5), FIELD(block7B, 0x0708),
      FIELD(block8Value, 24.5), FIELD(block9Value, 0x090A0B0Cu), FIELD(tag41, 25), FIELD(tag42, 26.5),
      FIELD(tag43, 27), FIELD(tag44, std::string("name")), FIELD(tag45, std::string("comment")),
      FIELD(tag46, std::string("more")), FIELD(block14Value, 28.5)};
  // clang-format on
  return all;
}

WaveformHeader fullRecord(bool ext1, bool ext2, bool text, bool block14) {
  WaveformHeader h;
  for (const auto &f : fields()) {
    f.set(h);
  }
  h.hasExtension1 = ext1, h.hasExtension2 = ext2, h.hasTextBlocks = text, h.hasBlock14 = block14;
  return h;
}

} // namespace

TEST(WaveformHeaderTest, WrittenRecordReadsBackToTheSameBytes) {
  const bool rows[][4] = {
      {false, false, false, false}, {false, true, false, false}, {true, false, true, false}, {true, true, true, true}};
  for (const auto &row : rows) {
    SCOPED_TRACE(::testing::Message() << row[0] << row[1] << row[2] << row[3]);
    WaveformHeader written = fullRecord(row[0], row[1], row[2], row[3]);
    Bytes bytes = written.getHeaderBytes();
    EXPECT_EQ(static_cast<int>(bytes.size()), written.getHeaderLength());
    // Every field differs from its default, so a field read wrong or not at
    // all writes other bytes; so do the flags.
    WaveformHeader read;
    read.setHeaderBytes(bytes);
    EXPECT_EQ(read.getHeaderBytes(), bytes) << "the second extension brings the first";
  }
}

TEST(WaveformHeaderTest, DefaultRecordSerializesToTheTabledBytes) {
  WaveformHeader h;
  h.stamp = 0x01020304;
  const Bytes expected = hex("87868584 FFFF0001 0002 01020304 0060"
                             "01 76 20202020202020202020202020202020 20202020202020202020202020202020"
                             "BFF0000000000000 FFFFFFFFFFFFFF BFF0000000000000 BFF0000000000000 BF800000 0080"
                             "54B075823B6C498A FF 7CF0BDC2 BFF0000000000000 BFF0000000000000 BFF0000000000000"
                             "FFFF FF BFF0000000000000 FF  02 01 01"
                             "03 19 BF800000 FF BFF0000000000000 BFF0000000000000 7CF0BDC2  04 08 BF800000 BF800000"
                             "05 08 0000000000000000  06 07 FF BF800000 FFFF  07 06 BF800000 FFFF"
                             "08 08 54B075823B6C498A  09 04 00000000  0A 06 FF BF800000 FF  0000");
  ASSERT_EQ(expected.size(), 229u);
  EXPECT_EQ(h.getHeaderBytes(), expected);
  EXPECT_EQ(*h.getHeader(), expected) << "the stamp is not renewed";
  EXPECT_EQ(h.getHeaderLength(), 229);
}

TEST(WaveformHeaderTest, ReadingKeepsTheFormatsRulesForTextsExtensionsAndUnknownBlocks) {
  WaveformHeader h;
  h.tag5 = std::string(32, 'k') + "dropped!";
  Bytes cut(32, 'k'), zeroFilled{'a', 'b', 'c'};
  cut.push_back(0xBF); // tag6 follows at once
  zeroFilled.resize(32);
  const auto block = h.getPlatformBlock();
  EXPECT_EQ(Bytes(block->begin() + 2, block->begin() + 35), cut);
  h.tag5 = "abc";
  Bytes bytes = h.getHeaderBytes();
  EXPECT_EQ(Bytes(bytes.begin() + 18, bytes.begin() + 50), zeroFilled);
  h.hasExtension1 = h.hasExtension2 = true;
  h.extension1 = 5.0;
  h.setHeaderBytes(bytes);
  EXPECT_EQ(h.tag5, "abc" + std::string(29, ' ')) << "zeros read as spaces";
  EXPECT_FALSE(h.hasExtension1 || h.hasExtension2) << "a 118-byte block 1 has no extension";
  EXPECT_EQ(h.extension1, 5.0);
  h.hasExtension2 = true;
  const int reported = h.getHeaderLength();
  EXPECT_EQ(reported + 8, static_cast<int>(h.getHeaderBytes().size())) << "length goes by the flags as they stand";

  h.tag45 = "ab";
  Bytes unknown = hex("87868584 FFFF0001 0002 01020304 0060 0B 04 78797A31 0D 00 09 04 01020304 0000");
  h.setHeaderBytes(unknown);
  EXPECT_EQ(h.tag45, "xy") << "a filled tag45 is read as a fixed field";
  EXPECT_EQ(h.block9Value, 0u) << "nothing behind block 13 is read";
  WaveformHeader before;
  Bytes shortBytes = hex("010141"), original = before.getHeaderBytes();
  before.setHeaderBytes(shortBytes);
  EXPECT_EQ(before.getHeaderBytes(), original) << "fewer than 4 bytes change nothing";
}

TEST(WaveformHeaderTest, DamagedBytesNeverReadPastThemAndGiveStableRecords) {
  WaveformHeader full = fullRecord(true, true, true, true);
  const Bytes good = full.getHeaderBytes();
  const WaveformHeader fresh;
  std::vector<Bytes> inputs;
  for (std::size_t n = 0; n <= good.size(); ++n) {
    inputs.emplace_back(good.begin(), good.begin() + static_cast<std::ptrdiff_t>(n));
  }
  const std::size_t prefixes = inputs.size();
  for (std::size_t at = 16; at + 1 < good.size() && good[at] != 0; at += 2u + good[at + 1]) {
    for (const int extra : {1, 255 - good[at + 1]}) {
      inputs.push_back(good);
      inputs.back()[at + 1] = static_cast<unsigned char>(good[at + 1] + extra);
    }
  }
  std::mt19937 random(20240601);
  for (int i = 0; i < 1000; ++i) {
    inputs.push_back(good);
    for (int flips = 1 + static_cast<int>(random() % 4); flips > 0; --flips) {
      inputs.back()[random() % good.size()] ^= static_cast<unsigned char>(1 + random() % 255);
    }
  }
  for (std::size_t i = 0; i < inputs.size(); ++i) {
    WaveformHeader h;
    h.setHeaderBytes(inputs[i]);
    if (i < prefixes && i >= 16) {
      for (const auto &f : fields()) {
        EXPECT_TRUE(f.same(h, full) || f.same(h, fresh)) << f.name << " from a cut at " << i;
      }
    }
    ASSERT_EQ(h.tag5.size(), 32u) << i;
    Bytes once = h.getHeaderBytes();
    ASSERT_EQ(static_cast<int>(once.size()), h.getHeaderLength()) << i;
    WaveformHeader again;
    again.setHeaderBytes(once);
    ASSERT_EQ(again.getHeaderBytes(), once) << i;
  }
}
