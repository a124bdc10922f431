#include "wavemill/waveform/exportimport/WaveformHeader.h"

#include "wavemill/waveform/BigEndian.h"

#include <algorithm>
#include <chrono>
#include <climits>
#include <cstddef>
#include <cstdint>

namespace Corvane::Wavemill::ExportImport {

namespace {

constexpr int Tag5Length = 32;
constexpr std::size_t Extension1Size = 126;
constexpr std::size_t Extension2Size = 134;
// The base block, blocks 1 to 10 with their prefixes and empty texts, and
// the terminator.
constexpr int64_t FixedLength = 229;

void append(std::vector<unsigned char> &bytes, const WaveformHeader::Bytes &block) {
  bytes.insert(bytes.end(), block->begin(), block->end());
}

// Reads the content of one block. Each field is taken only if it fits, so
// a shorter block of an older writer leaves the fields it lacks as they are.
void readBlock(WaveformHeader &h, unsigned char id, gsl::span<unsigned char> content) {
  int pos = 0;
  switch (id) {
  case 1:
    h.tag5.assign(Tag5Length, ' ');
    BigEndian::parse(content, &pos, &h.tag5, &h.tag6, &h.tag7, &h.tag8, &h.tag9, &h.tag10, &h.tag11, &h.tag12, &h.tag13,
                     &h.tag15, &h.tag16, &h.tag17, &h.tag22, &h.tag25, &h.tag26, &h.tag27, &h.tag28, &h.tag29, &h.tag30,
                     &h.tag31, &h.tag32, &h.tag33, &h.tag34, &h.extension1, &h.extension2);
    h.hasExtension1 = content.size() >= Extension1Size;
    h.hasExtension2 = content.size() >= Extension2Size;
    break;
  case 2:
    h.reservedText.clear();
    BigEndian::parse(content, &pos, &h.block2Value, &h.reservedText);
    break;
  case 3:
    BigEndian::parse(content, &pos, &h.tag20, &h.tag35, &h.tag36, &h.tag37, &h.tag38);
    break;
  case 4:
    BigEndian::parse(content, &pos, &h.block4A, &h.block4B);
    break;
  case 5:
    h.block5Text.clear();
    BigEndian::parse(content, &pos, &h.block5Value, &h.block5Text);
    break;
  case 6:
    BigEndian::parse(content, &pos, &h.block6A, &h.block6B, &h.block6C);
    break;
  case 7:
    BigEndian::parse(content, &pos, &h.block7A, &h.block7B);
    break;
  case 8:
    BigEndian::parse(content, &pos, &h.block8Value);
    break;
  case 9:
    BigEndian::parse(content, &pos, &h.block9Value);
    break;
  case 10:
    h.tag44.clear();
    BigEndian::parse(content, &pos, &h.tag41, &h.tag42, &h.tag43, &h.tag44);
    break;
  case 11:
    // Not emptied first: a tag45 that holds text is read as a fixed field of
    // that length, as every reader of the format does.
    BigEndian::parse(content, &pos, &h.tag45);
    h.hasTextBlocks = true;
    break;
  case 12:
    BigEndian::parse(content, &pos, &h.tag46);
    h.hasTextBlocks = true;
    break;
  case 14:
    BigEndian::parse(content, &pos, &h.block14Value);
    h.hasBlock14 = true;
    break;
  default:
    break;
  }
}

} // namespace

void updateEnabled(bool &a, bool &b) {
  if (b) {
    a = true;
  }
}

WaveformHeader::WaveformHeader()
    : stamp(static_cast<unsigned int>(
          static_cast<uint64_t>(std::chrono::system_clock::now().time_since_epoch().count()) & 0xFFFFFFFFu)) {}

WaveformHeader::Bytes WaveformHeader::getHeader() {
  auto bytes = std::make_shared<std::vector<unsigned char>>();
  BigEndian::append(bytes, magic, headerId, version, stamp, baseExtra);
  append(*bytes, getPlatformBlock());
  append(*bytes, BigEndian::makeBlock(2, block2Value, reservedText));
  append(*bytes, BigEndian::makeBlock(3, tag20, tag35, tag36, tag37, tag38));
  append(*bytes, BigEndian::makeBlock(4, block4A, block4B));
  append(*bytes, BigEndian::makeBlock(5, block5Value, block5Text));
  append(*bytes, BigEndian::makeBlock(6, block6A, block6B, block6C));
  append(*bytes, BigEndian::makeBlock(7, block7A, block7B));
  append(*bytes, BigEndian::makeBlock(8, block8Value));
  append(*bytes, BigEndian::makeBlock(9, block9Value));
  append(*bytes, BigEndian::makeBlock(10, tag41, tag42, tag43, tag44));
  if (hasTextBlocks) {
    append(*bytes, BigEndian::makeBlock(11, tag45));
    append(*bytes, BigEndian::makeBlock(12, tag46));
  }
  if (hasBlock14) {
    append(*bytes, BigEndian::makeBlock(14, block14Value));
  }
  bytes->push_back(0);
  bytes->push_back(0);
  return bytes;
}

std::vector<unsigned char> WaveformHeader::getHeaderBytes() { return *getHeader(); }

int WaveformHeader::getHeaderLength() const {
  int64_t length = FixedLength + (hasExtension1 ? 8 : 0) + (hasExtension2 ? 8 : 0);
  length += static_cast<int64_t>(reservedText.size() + block5Text.size() + tag44.size());
  if (hasTextBlocks) {
    length += 4 + static_cast<int64_t>(tag45.size() + tag46.size());
  }
  if (hasBlock14) {
    length += 10;
  }
  return static_cast<int>(std::min<int64_t>(length, INT_MAX));
}

WaveformHeader::Bytes WaveformHeader::getPlatformBlock() {
  // The size byte is set below, once the extensions are known.
  auto block = std::make_shared<std::vector<unsigned char>>(std::vector<unsigned char>{1, 0});
  append(*block, toByteArray(tag5, Tag5Length));
  BigEndian::append(block, tag6, tag7, tag8, tag9, tag10, tag11, tag12, tag13, tag15, tag16, tag17, tag22, tag25, tag26,
                    tag27, tag28, tag29, tag30, tag31, tag32, tag33, tag34);
  updateEnabled(hasExtension1, hasExtension2);
  if (hasExtension1) {
    BigEndian::append(block, extension1);
  }
  if (hasExtension2) {
    BigEndian::append(block, extension2);
  }
  (*block)[1] = static_cast<unsigned char>(block->size() - 2);
  return block;
}

void WaveformHeader::setHeader(Bytes bytes) {
  if (!bytes || bytes->size() < 4) {
    return;
  }
  // A header is a few hundred bytes; the cap only keeps positions in an int.
  const gsl::span<unsigned char> all(bytes->data(), std::min<std::size_t>(bytes->size(), INT_MAX));
  const int size = static_cast<int>(all.size());
  int pos = 0;
  BigEndian::parse(all, &pos, &magic, &headerId, &version, &stamp, &baseExtra);
  while (pos < size) {
    const unsigned char id = all[static_cast<std::size_t>(pos)];
    // Id 0 starts the terminator, and block 13 and ids above 14 are not
    // known: nothing behind them can be placed.
    if (id == 0 || id == 13 || id > 14 || pos + 1 >= size) {
      return;
    }
    const int length = all[static_cast<std::size_t>(pos) + 1];
    const int start = pos + 2;
    // A cut or damaged header may claim more than is left. Half a block is
    // not read at all, so that every field holds either what was written or
    // what it held before.
    if (length > size - start) {
      return;
    }
    readBlock(*this, id, all.subspan(static_cast<std::size_t>(start), static_cast<std::size_t>(length)));
    pos = start + length;
  }
}

void WaveformHeader::setHeaderBytes(gsl::span<unsigned char> bytes) {
  setHeader(std::make_shared<std::vector<unsigned char>>(bytes.begin(), bytes.end()));
}

WaveformHeader::Bytes WaveformHeader::toByteArray(const std::string &text) {
  return std::make_shared<std::vector<unsigned char>>(text.begin(), text.end());
}

WaveformHeader::Bytes WaveformHeader::toByteArray(const std::string &text, int length) {
  auto bytes = std::make_shared<std::vector<unsigned char>>(static_cast<std::size_t>(std::max(length, 0)), 0);
  std::copy_n(text.begin(), std::min(text.size(), bytes->size()), bytes->begin());
  return bytes;
}

} // namespace Corvane::Wavemill::ExportImport
