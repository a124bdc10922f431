#include "wavemill/waveform/Packager.h"

#include <climits>
#include <cstdint>
#include <cstring>
#include <new>

namespace Corvane::Wavemill {

namespace {

// The buffer and positions that both packagers share; they differ only in
// the prefix and in how the end of the reader is finished.
struct Window {
  DataReader *reader;
  Encryptor *encryptor;
  unsigned char *buffer;
  int blockSize;
  int bufferSize;
  int &readPos;
  int &writePos;
  int &bytesLeft;
};

void storeBigEndian(unsigned char *dest, std::uint32_t word) {
  dest[0] = static_cast<unsigned char>(word >> 24);
  dest[1] = static_cast<unsigned char>(word >> 16);
  dest[2] = static_cast<unsigned char>(word >> 8);
  dest[3] = static_cast<unsigned char>(word);
}

int clampToInt(std::int64_t value) {
  return value > INT_MAX ? INT_MAX : value < INT_MIN ? INT_MIN : static_cast<int>(value);
}

// The buffer size for `blocks` blocks, or 0 when the arguments give none
// that an int can index.
int bufferBytes(int blocks, int blockSize) {
  if (blocks < 1 || blockSize < 1) {
    return 0;
  }
  const std::int64_t bytes = static_cast<std::int64_t>(blocks) * blockSize;
  return bytes > INT_MAX ? 0 : static_cast<int>(bytes);
}

// Reads behind `writePos` until the buffer is full; true when the reader has
// nothing more to give. Never more than the reader's size is taken: a header
// reader of exactly 16 bytes reports 0 bytes but would still deliver them.
bool readBehind(const Window &w) {
  const int room = w.bufferSize - w.writePos;
  const int wanted = w.bytesLeft < room ? (w.bytesLeft > 0 ? w.bytesLeft : 0) : room;
  int got = wanted > 0 ? w.reader->read(w.buffer + w.writePos, 1, wanted) : 0;
  got = got < 0 ? 0 : got > wanted ? wanted : got;
  w.writePos += got;
  const std::int64_t left = static_cast<std::int64_t>(w.bytesLeft) - got;
  // A reader that stops short of its size would otherwise keep the
  // delivery loop waiting for bytes that never come.
  w.bytesLeft = left < 0 || got < wanted ? 0 : static_cast<int>(left);
  return w.bytesLeft == 0;
}

// Finishes the chunk at a block boundary: pads with zeros, or takes the
// bytes behind the last whole block back into `leftover`, in their order.
void finishChunk(const Window &w, bool holdBack, unsigned char *leftover, int &leftoverCount) {
  while (w.writePos % w.blockSize != 0 && w.writePos < w.bufferSize) {
    if (holdBack) {
      --w.writePos;
      leftover[w.writePos % w.blockSize] = w.buffer[w.writePos];
      ++leftoverCount;
    } else {
      w.buffer[w.writePos++] = 0;
    }
  }
}

void compact(const Window &w) {
  const int unread = w.readPos < w.writePos ? w.writePos - w.readPos : 0;
  if (unread > 0) {
    std::memmove(w.buffer, w.buffer + w.readPos, static_cast<std::size_t>(unread));
  }
  w.writePos = unread;
  w.readPos = 0;
}

void resetWindow(const Window &w) {
  if (w.readPos < w.writePos && w.readPos != 0) {
    compact(w);
  } else {
    w.readPos = 0;
    w.writePos = 0;
  }
}

int pending(const Window &w) { return clampToInt(static_cast<std::int64_t>(w.bytesLeft) - w.readPos + w.writePos); }

// Encrypts whole blocks straight into `out`. The buffer always holds whole
// blocks (a full buffer, or a finished chunk), so `take` never splits one.
template <class Refill> int deliver(const Window &w, unsigned char *out, int blocks, Refill refill) {
  if (blocks < 1 || out == nullptr) {
    return 0;
  }
  int wanted = blocks;
  while (wanted > 0 && pending(w) >= 1) {
    const int available = w.writePos - w.readPos;
    const int take = available / w.blockSize > wanted ? w.blockSize * wanted : available;
    w.encryptor->process(out, w.buffer + w.readPos, static_cast<unsigned int>(take));
    w.readPos += take;
    wanted -= take / w.blockSize;
    out += take;
    if (w.writePos == w.readPos) {
      w.readPos = 0;
      w.writePos = 0;
      refill();
    }
  }
  return blocks - wanted;
}

} // namespace

WPL_Packager::WPL_Packager(DataReader *reader, Encryptor *encryptor, int tag, int blocks, int blockSize,
                           unsigned int pkgSize, unsigned int leftoverCount, unsigned char *leftoverBytes)
    : reader(reader), encryptor(encryptor), blockSize(blockSize), bufferSize(bufferBytes(blocks, blockSize)),
      readPos(0), writePos(0), bytesLeft(0), leftoverCount(0), holdBack(false) {
  const bool prefix = tag != 16 && tag != 32;
  const bool takesLeftover = !prefix && leftoverCount != 0;
  if (reader == nullptr || encryptor == nullptr || bufferSize < 1 || (prefix && bufferSize < 8) ||
      (takesLeftover && (leftoverBytes == nullptr || leftoverCount > static_cast<unsigned int>(bufferSize)))) {
    return;
  }
  buffer.reset(new (std::nothrow) unsigned char[static_cast<std::size_t>(bufferSize)]);
  leftover.reset(new (std::nothrow) unsigned char[static_cast<std::size_t>(blockSize)]);
  if (!buffer || !leftover) {
    buffer.reset();
    return;
  }
  bytesLeft = clampToInt(reader->size());
  if (prefix) {
    storeBigEndian(buffer.get(), static_cast<std::uint32_t>(tag >= 33 ? tag - 32 : tag));
    storeBigEndian(buffer.get() + 4, pkgSize != 0 ? pkgSize : static_cast<std::uint32_t>(bytesLeft));
    writePos = 8;
  } else if (takesLeftover) {
    std::memcpy(buffer.get(), leftoverBytes, leftoverCount);
    writePos = static_cast<int>(leftoverCount);
  }
  holdBack = (tag & 32) == 0 && pkgSize != 0;
  fillBuffer();
}

WPL_Packager::~WPL_Packager() = default;

void WPL_Packager::readMore() {
  const Window w{reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft};
  if (readBehind(w)) {
    finishChunk(w, holdBack, leftover.get(), leftoverCount);
  }
}

void WPL_Packager::fillBuffer() {
  if (!buffer) {
    return;
  }
  if (readPos != 0) {
    compact({reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft});
  }
  readMore();
}

int WPL_Packager::getBytesLeft() {
  return pending({reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft});
}

void WPL_Packager::resetBuffer() {
  resetWindow({reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft});
}

int WPL_Packager::getBlocks(unsigned char *out, int blocks) {
  if (!buffer) {
    return 0;
  }
  return deliver({reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft}, out, blocks,
                 [this] { readMore(); });
}

int WPL_Packager::getLeftoverBytes(unsigned char *dest) {
  if (dest != nullptr && leftoverCount > 0) {
    std::memcpy(dest, leftover.get(), static_cast<std::size_t>(leftoverCount));
  }
  return leftoverCount;
}

Packager::Packager(DataReader *reader, Encryptor *encryptor, int tag, int blocks, int blockSize)
    : reader(reader), encryptor(encryptor), blockSize(blockSize), bufferSize(bufferBytes(blocks, blockSize)),
      readPos(0), writePos(0), bytesLeft(0) {
  if (reader == nullptr || encryptor == nullptr || bufferSize < 8) {
    return;
  }
  buffer.reset(new (std::nothrow) unsigned char[static_cast<std::size_t>(bufferSize)]);
  if (!buffer) {
    return;
  }
  bytesLeft = clampToInt(reader->size());
  // The tag word goes out in the host's order: files made by this packager
  // have always had it so, and readers of them expect it.
  std::memcpy(buffer.get(), &tag, 4);
  storeBigEndian(buffer.get() + 4, static_cast<std::uint32_t>(bytesLeft));
  writePos = 8;
  fillBuffer();
}

Packager::~Packager() = default;

void Packager::readMore() {
  const Window w{reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft};
  int none = 0;
  if (readBehind(w)) {
    finishChunk(w, false, nullptr, none);
  }
}

void Packager::fillBuffer() {
  if (!buffer) {
    return;
  }
  if (readPos != 0) {
    compact({reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft});
  }
  readMore();
}

int Packager::getBytesLeft() {
  return pending({reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft});
}

void Packager::resetBuffer() {
  resetWindow({reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft});
}

int Packager::getBlocks(unsigned char *out, int blocks) {
  if (!buffer) {
    return 0;
  }
  return deliver({reader, encryptor, buffer.get(), blockSize, bufferSize, readPos, writePos, bytesLeft}, out, blocks,
                 [this] { readMore(); });
}

} // namespace Corvane::Wavemill
