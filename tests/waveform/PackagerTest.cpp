#include "wavemill/waveform/Packager.h"

#include "support/WaveformFiles.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <vector>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::Testing;

namespace {

Bytes word(std::uint32_t w) {
  return {static_cast<unsigned char>(w >> 24), static_cast<unsigned char>(w >> 16), static_cast<unsigned char>(w >> 8),
          static_cast<unsigned char>(w)};
}

Bytes join(std::initializer_list<Bytes> parts) {
  Bytes all;
  for (const auto &p : parts) {
    all.insert(all.end(), p.begin(), p.end());
  }
  return all;
}

// Takes every block, `step` at a time, and decrypts them.
template <class P> Bytes drain(P &packager, int step) {
  Bytes cipher;
  Bytes piece(static_cast<std::size_t>(step) * 16);
  for (int got = step; got == step;) {
    got = packager.getBlocks(piece.data(), step);
    cipher.insert(cipher.end(), piece.begin(), piece.begin() + got * 16);
  }
  return cipherBlocks<Decryptor>(fixedFileKey, cipher);
}

} // namespace

TEST(PackagerTest, ChunksAreFramedPaddedOrHeldBackByTheirTag) {
  struct Row {
    const char *name;
    int tag;
    std::size_t body;
    unsigned int pkgSize;
    std::size_t leftoverIn;
    Bytes delivered; // plain bytes
    Bytes heldBack;
  };
  const Bytes body = patternBytes(5000, 0x40);
  const Bytes in = patternBytes(15, 0x90), in4(in.begin(), in.begin() + 4);
  auto part = [&](std::size_t from, std::size_t to) { return Bytes(body.begin() + from, body.begin() + to); };
  auto prefix = [](std::uint32_t tag, std::uint32_t length) { return join({word(tag), word(length)}); };
  const Row rows[] = {
      {"an empty reader gives the prefix and 8 zeros", 3, 0, 0, 0, join({prefix(3, 0), Bytes(8, 0)}), {}},
      {"8 body bytes fill the first block", 2, 8, 0, 0, join({prefix(2, 8), part(0, 8)}), {}},
      {"hold-back keeps what follows the last whole block", 2, 20, 100, 0, join({prefix(2, 100), part(0, 8)}),
       part(8, 20)},
      {"a chunk smaller than a block is held back whole", 2, 5, 100, 0, {}, join({prefix(2, 100), part(0, 5)})},
      {"the last chunk opens with the leftover and pads", 32, 4, 100, 4, join({in4, part(0, 4), Bytes(8, 0)}), {}},
      {"leftover and body making whole blocks leave nothing", 16, 28, 100, 4, join({in4, part(0, 28)}), {}},
      {"a prefix ignores leftovers", 3, 8, 0, 4, join({prefix(3, 8), part(0, 8)}), {}},
      {"tag 33 writes tag 1, never holds back", 33, 20, 100, 0, join({prefix(1, 100), part(0, 20), Bytes(4, 0)}), {}},
      {"a continuation across buffer refills", 16, 5000, 100000, 0, part(0, 4992), part(4992, 5000)},
      {"a whole package across refills", 34, 4990, 0, 0, join({prefix(2, 4990), part(0, 4990), Bytes(10, 0)}), {}},
  };
  Encryptor encryptor;
  encryptor.init(fixedFileKey);
  for (const Row &row : rows) {
    for (int step : {1, 7, 400}) {
      SCOPED_TRACE(std::string(row.name) + ", blocks per call " + std::to_string(step));
      Buffer_DataReader reader(const_cast<unsigned char *>(body.data()), static_cast<int>(row.body));
      WPL_Packager packager(&reader, &encryptor, row.tag, 256, 16, row.pkgSize,
                            static_cast<unsigned int>(row.leftoverIn), const_cast<unsigned char *>(in.data()));
      EXPECT_EQ(drain(packager, step), row.delivered);
      Bytes held(15, 0xee);
      held.resize(static_cast<std::size_t>(packager.getLeftoverBytes(held.data())));
      EXPECT_EQ(held, row.heldBack);
    }
  }
}

TEST(PackagerTest, ForerunnerWritesItsTagInHostOrderAndBadArgumentsDeliverNothing) {
  const Bytes body = patternBytes(3, 1);
  Encryptor encryptor;
  encryptor.init(fixedFileKey);
  Buffer_DataReader reader(const_cast<unsigned char *>(body.data()), 3);
  Packager old(&reader, &encryptor, 0x01020304, 256, 16);
  const Bytes plain = drain(old, 4);
  const std::uint32_t tag = 0x01020304;
  Bytes hostTag(4);
  std::memcpy(hostTag.data(), &tag, 4);
  EXPECT_EQ(plain, join({hostTag, word(3), body, Bytes(5, 0)}));

  // A header reader over the 16 base bytes alone has a size of 0 but
  // would still hand those bytes out; they must not become the body.
  Bytes base = patternBytes(16, 1);
  HeaderBuffer_DataReader baseOnly(base.data(), 16);
  WPL_Packager header(&baseOnly, &encryptor, 1, 256, 16, 0, 0, nullptr);
  EXPECT_EQ(drain(header, 4), join({word(1), word(0), Bytes(8, 0)}));

  unsigned char out[64];
  struct Bad {
    const char *name;
    DataReader *reader;
    Encryptor *encryptor;
    int tag, blocks, blockSize;
    unsigned int leftoverCount;
    unsigned char *leftover;
  } bad[] = {{"no reader", nullptr, &encryptor, 2, 256, 16, 0, nullptr},
             {"no encryptor", &reader, nullptr, 2, 256, 16, 0, nullptr},
             {"no blocks", &reader, &encryptor, 2, 0, 16, 0, nullptr},
             {"no block size", &reader, &encryptor, 2, 256, 0, 0, nullptr},
             {"no room for the prefix", &reader, &encryptor, 2, 1, 4, 0, nullptr},
             {"an int overflowing buffer", &reader, &encryptor, 2, 1 << 30, 16, 0, nullptr},
             {"a leftover without bytes", &reader, &encryptor, 16, 256, 16, 4, nullptr},
             {"a leftover beyond the buffer", &reader, &encryptor, 16, 1, 16, 17, out}};
  for (const Bad &b : bad) {
    SCOPED_TRACE(b.name);
    reader.reset();
    WPL_Packager packager(b.reader, b.encryptor, b.tag, b.blocks, b.blockSize, 0, b.leftoverCount, b.leftover);
    EXPECT_EQ(packager.getBlocks(out, 4), 0);
    EXPECT_EQ(packager.getLeftoverBytes(out), 0);
  }
  reader.reset();
  WPL_Packager good(&reader, &encryptor, 2, 256, 16, 0, 0, nullptr);
  EXPECT_EQ(good.getBlocks(out, 0), 0);
  EXPECT_EQ(good.getBlocks(nullptr, 4), 0);
  EXPECT_EQ(good.getBlocks(out, 4), 1);
}
