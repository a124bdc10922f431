#include "wavemill/waveform/FileHeader.h"

#include <algorithm>
#include <cstring>
#include <new>

using Corvane::Wavemill::DataReader;
using Corvane::Wavemill::DataWriter;

namespace {

// The size byte of a serialized block limits every block to 255 bytes.
constexpr int MaxBlockBytes = 255;
// writeBuffer rejects tags above this one; hasTag those above 48.
constexpr int HighestBufferTag = 49;

// Zeroed, so that bytes no default covers (the magic number) serialize the
// same on every run.
char *allocateBlock(int size) { return new (std::nothrow) char[static_cast<std::size_t>(size)](); }

// The bytes that a block's memory holds from `offset` on.
int bytesFrom(const FileHeader::BlockInfo &block, int offset) {
  return block.data != nullptr && offset < block.size ? block.size - offset : 0;
}

} // namespace

FileHeader::BlockInfo::BlockInfo(unsigned char id, unsigned char size, char *data) : id(id), size(size), data(data) {}

FileHeader::FileHeader(bool flexible) : modified(false), valid(false), headerSize(0), flexible(flexible) { doInit(); }

FileHeader::FileHeader(const FileHeader &other, bool flexible)
    : modified(false), valid(false), headerSize(0), flexible(flexible) {
  doInit();
  FileHeader::clearHeader();
  FileHeader::convert(other);
}

FileHeader::~FileHeader() {
  for (BlockInfo &block : blocks) {
    delete[] block.data;
  }
}

FileHeader *FileHeader::build() {
  try {
    return new (std::nothrow) FileHeader(false);
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

FileHeader *FileHeader::copy(const FileHeader &other) {
  try {
    auto *header = new (std::nothrow) FileHeader(other, other.flexible);
    if (header != nullptr) {
      header->clear();
      header->convert(other);
    }
    return header;
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

void FileHeader::doInit() {
  blocks.clear();
  for (int i = 0; i < StandardBlockCount; ++i) {
    blocks.emplace_back(static_cast<unsigned char>(i), 0, nullptr);
    blockSizes[i] = 0;
  }
  for (int tag = 0; tag < TagCount; ++tag) {
    locations[tag] = Location{-1, 0, 0};
    tagRegistered[tag] = false;
  }
  registerLocation(TagMagic, Location{0, 4, BlockBase});
  registerLocation(TagHeaderId, Location{4, 4, BlockBase});
  registerLocation(TagVersion, Location{8, 2, BlockBase});
  registerLocation(TagStamp, Location{10, 4, BlockBase});
  registerLocation(TagBaseExtra, Location{14, 2, BlockBase});
}

bool FileHeader::isRegistered(int tag) const { return tag >= 0 && tag < TagCount && tagRegistered[tag]; }

bool FileHeader::resizeBlock(BlockInfo &block, int size, int keep) {
  char *data = allocateBlock(size);
  if (data == nullptr) {
    return false;
  }
  if (block.data != nullptr) {
    std::memcpy(data, block.data, static_cast<std::size_t>(std::min({keep, size, static_cast<int>(block.size)})));
  }
  delete[] block.data;
  block.data = data;
  block.size = static_cast<unsigned char>(size);
  return true;
}

void FileHeader::registerLocation(Tag tag, Location location) {
  // Tag 49 passes the bound of writeBuffer but has no slot here, so it is
  // never registered.
  if (tag < 0 || tag >= TagCount || tagRegistered[tag]) {
    return;
  }
  if (location.block < 0 || location.block >= StandardBlockCount || location.offset < 0 || location.length < 0 ||
      location.offset > MaxBlockBytes || location.length > MaxBlockBytes - location.offset) {
    return;
  }
  locations[tag] = location;
  tagRegistered[tag] = true;
  const int end = location.offset + location.length;
  if (end > blockSizes[location.block]) {
    blockSizes[location.block] = end;
    BlockInfo &block = blocks[static_cast<std::size_t>(location.block)];
    delete[] block.data;
    block.data = nullptr;
    block.size = 0;
  }
}

void FileHeader::registerBlock(HeaderBlockId block, const FieldPlace *places, int count) {
  if (places == nullptr || block < 0 || block >= StandardBlockCount) {
    return;
  }
  int offset = blockSizes[block];
  for (int i = 0; i < count; ++i) {
    registerLocation(places[i].tag, Location{offset, places[i].length, block});
    // Capped past the largest block so that absurd lengths cannot overflow;
    // every later tag is then refused anyway.
    offset = std::min(offset + std::clamp(places[i].length, 0, MaxBlockBytes + 1), MaxBlockBytes + 1);
  }
}

void FileHeader::clear() {
  for (int i = 0; i < StandardBlockCount; ++i) {
    BlockInfo &block = blocks[static_cast<std::size_t>(i)];
    if (block.data == nullptr && blockSizes[i] != 0) {
      block.data = allocateBlock(blockSizes[i]);
      if (block.data == nullptr) {
        return;
      }
      block.size = static_cast<unsigned char>(blockSizes[i]);
    } else {
      if (block.size > blockSizes[i]) {
        block.size = static_cast<unsigned char>(blockSizes[i]);
      }
      if (blockSizes[i] == 0) {
        delete[] block.data;
        block.data = nullptr;
      }
    }
  }
  for (std::size_t i = StandardBlockCount; i < blocks.size(); ++i) {
    delete[] blocks[i].data;
  }
  blocks.resize(StandardBlockCount, BlockInfo(0, 0, nullptr));
  clearHeader();
  modified = true;
  valid = verifyHeader();
}

int FileHeader::writeBuffer(Tag tag, const char *src, int len) {
  if (tag > HighestBufferTag || !isRegistered(tag) || src == nullptr || len < 0) {
    return 0;
  }
  const Location &location = locations[tag];
  BlockInfo &block = blocks[static_cast<std::size_t>(location.block)];
  int n = 0;
  if (location.length > 0) {
    n = std::min(len, location.length);
  } else {
    // A variable field is the last thing in its block, so its length sets
    // the block's.
    n = std::min({len, MaxBlockBytes, MaxBlockBytes - location.offset});
    const int end = location.offset + n;
    if (block.size < end) {
      if (!resizeBlock(block, end, location.offset)) {
        return 0;
      }
    } else if (block.size > end) {
      block.size = static_cast<unsigned char>(end);
    }
  }
  modified = true;
  const int stored = std::min(n, bytesFrom(block, location.offset));
  if (stored > 0) {
    std::memcpy(block.data + location.offset, src, static_cast<std::size_t>(stored));
  }
  return n;
}

int FileHeader::readBuffer(char *dest, int len, Tag tag) const {
  if (tag < 0 || tag > HighestBufferTag || !isRegistered(tag) || dest == nullptr || len < 1) {
    return 0;
  }
  const Location &location = locations[tag];
  const BlockInfo &block = blocks[static_cast<std::size_t>(location.block)];
  const int n = std::min({len, getTagLengthActual(tag), bytesFrom(block, location.offset)});
  if (n <= 0) {
    return 0;
  }
  std::memcpy(dest, block.data + location.offset, static_cast<std::size_t>(n));
  return n;
}

int FileHeader::getTagLengthActual(Tag tag) const {
  if (tag < 0 || tag > HighestBufferTag || !isRegistered(tag)) {
    return 0;
  }
  const Location &location = locations[tag];
  const BlockInfo &block = blocks[static_cast<std::size_t>(location.block)];
  if (block.data == nullptr) {
    return 0;
  }
  return location.length > 0 ? location.length : bytesFrom(block, location.offset);
}

bool FileHeader::getTagLocation(Tag tag, int &offset, int &length) const {
  if (tag < 0 || tag >= TagCount) {
    return false;
  }
  offset = locations[tag].offset;
  length = locations[tag].length;
  return tagRegistered[tag];
}

bool FileHeader::hasTag(Tag tag) const { return isRegistered(tag); }

unsigned int FileHeader::getHeaderId() const { return 1; }

int FileHeader::getCurrentHeaderSize() const {
  const std::size_t count = flexible ? blocks.size() : 1;
  int size = 0;
  int counted = 0;
  for (std::size_t i = 0; i < count; ++i) {
    if (blocks[i].data != nullptr && blocks[i].size > 0) {
      size += blocks[i].size;
      ++counted;
    }
  }
  if (flexible && counted >= 2) {
    size += 2 * counted;
  }
  return size;
}

bool FileHeader::write(DataWriter *writer) {
  if (blocks[0].data == nullptr) {
    clear();
  }
  if (blocks[0].data == nullptr || !valid || writer == nullptr || !writer->isValid()) {
    return false;
  }
  if (!modified) {
    return true;
  }
  writer->reset();
  const std::size_t count = flexible ? blocks.size() : 1;
  for (std::size_t i = 0; i < count; ++i) {
    // A standard block stands at the index of its id. A block read with an
    // id above 14 stands behind them, where its id indexes another block or
    // none, so its own memory decides for every block.
    const BlockInfo &block = blocks[i];
    if (block.size == 0 || block.data == nullptr) {
      continue;
    }
    if (block.id != 0) {
      const unsigned char prefix[2] = {block.id, block.size};
      if (writer->write(&prefix[0], 1, 1) == 0 || writer->write(&prefix[1], 1, 1) == 0) {
        return false;
      }
    }
    if (writer->write(block.data, block.size, 1) == 0) {
      return false;
    }
  }
  if (flexible) {
    const unsigned char terminator[2] = {0, 0};
    if (writer->write(terminator, 2, 1) == 0) {
      return false;
    }
  }
  if (!writer->close()) {
    return false;
  }
  headerSize = getCurrentHeaderSize();
  modified = false;
  return true;
}

bool FileHeader::read(DataReader *reader) {
  if (blocks[0].data == nullptr) {
    clear();
  }
  BlockInfo &base = blocks[0];
  if (base.data == nullptr || reader == nullptr || !reader->isValid()) {
    valid = false;
    return false;
  }
  reader->reset();
  // A variable field registered in block 0 may have shortened it.
  if ((base.size < blockSizes[0] && !resizeBlock(base, blockSizes[0], base.size)) ||
      reader->read(base.data, blockSizes[0], 1) != 1) {
    valid = false;
    return false;
  }
  int total = blockSizes[0];
  if (flexible) {
    unsigned char lastId = 0;
    for (;;) {
      unsigned char id = 0;
      unsigned char size = 0;
      if (reader->read(&id, 1, 1) != 1 || reader->read(&size, 1, 1) != 1) {
        break;
      }
      total += 2;
      if (id <= lastId) {
        if (id != 0 || size != 0) {
          valid = false;
          return false;
        }
        break;
      }
      lastId = id;
      BlockInfo *block = nullptr;
      if (id >= StandardBlockCount) {
        char *data = allocateBlock(size);
        if (data == nullptr) {
          valid = false;
          return false;
        }
        blocks.emplace_back(id, size, data);
        block = &blocks.back();
      } else {
        block = &blocks[id];
        // A shorter block leaves the larger size in place, and the bytes
        // behind its content as they were.
        if (block->size < size && !resizeBlock(*block, size, 0)) {
          valid = false;
          return false;
        }
      }
      if (size > 0 && reader->read(block->data, size, 1) != 1) {
        valid = false;
        return false;
      }
      total += size;
    }
  }
  headerSize = total;
  modified = true;
  valid = verifyHeader();
  return valid;
}

bool FileHeader::headerIdMatches() const {
  unsigned char bytes[4] = {};
  readBuffer(reinterpret_cast<char *>(bytes), 4, TagHeaderId);
  const unsigned int id = (static_cast<unsigned int>(bytes[0]) << 24) | (static_cast<unsigned int>(bytes[1]) << 16) |
                          (static_cast<unsigned int>(bytes[2]) << 8) | bytes[3];
  return id == getHeaderId();
}

void FileHeader::clearHeader() {
  const unsigned int id = getHeaderId();
  const char idBytes[4] = {static_cast<char>(id >> 24), static_cast<char>(id >> 16), static_cast<char>(id >> 8),
                           static_cast<char>(id)};
  const char version[2] = {0, 3};
  const char zeros[4] = {};
  writeBuffer(TagHeaderId, idBytes, 4);
  writeBuffer(TagVersion, version, 2);
  writeBuffer(TagStamp, zeros, 4);
  writeBuffer(TagBaseExtra, zeros, 2);
}

bool FileHeader::verifyHeader() { return true; }

void FileHeader::convert(const FileHeader &other) {
  headerSize = other.headerSize;
  if (getHeaderId() == other.getHeaderId()) {
    copyData(other);
    return;
  }
  char bytes[MaxBlockBytes + 1];
  for (int tag = 0; tag < TagCount; ++tag) {
    if (tag == TagHeaderId || !isRegistered(tag) || !other.isRegistered(tag) ||
        locations[tag].length != other.locations[tag].length) {
      continue;
    }
    // A variable field has length 0 on both sides: nothing is read, and the
    // field here ends up empty.
    const int n = other.readBuffer(bytes, locations[tag].length, static_cast<Tag>(tag));
    writeBuffer(static_cast<Tag>(tag), bytes, n);
  }
}

void FileHeader::copyData(const FileHeader &other) {
  if (&other == this) {
    return;
  }
  for (const BlockInfo &source : other.blocks) {
    if (source.size == 0 || source.data == nullptr) {
      continue;
    }
    BlockInfo *target = nullptr;
    // Ids up to 15 name an index, one more than the standard blocks: a
    // block 15 lands on whatever entry stands at index 15.
    if (source.id <= StandardBlockCount && source.id < blocks.size()) {
      target = &blocks[source.id];
    } else {
      const auto found = std::find_if(blocks.begin() + StandardBlockCount, blocks.end(),
                                      [&](const BlockInfo &block) { return block.id == source.id; });
      if (found != blocks.end()) {
        target = &*found;
      } else {
        blocks.emplace_back(source.id, 0, nullptr);
        target = &blocks.back();
      }
    }
    if (target->size < source.size && !resizeBlock(*target, source.size, 0)) {
      valid = false;
      return;
    }
    std::memcpy(target->data, source.data, source.size);
  }
}
