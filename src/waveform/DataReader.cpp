#include "wavemill/waveform/DataReader.h"

#include <cstring>

namespace Corvane::Wavemill {

namespace {
// The serialized header's base block travels in the file head, not in the
// header package.
constexpr int HiddenHeaderBytes = 16;
} // namespace

DataReader::~DataReader() = default;

Buffer_DataReader::Buffer_DataReader(void *buf, int len)
    : buf(static_cast<unsigned char *>(buf)), bufLen(len), bufPos(0) {}

int Buffer_DataReader::read(void *dest, int size, int count) {
  if (buf == nullptr || dest == nullptr) {
    return 0;
  }
  int64_t n = static_cast<int64_t>(size) * count;
  if (bufPos + n > bufLen) {
    n = static_cast<int64_t>(bufLen) - bufPos;
  }
  if (n <= 0) {
    return 0;
  }
  std::memcpy(dest, buf + bufPos, static_cast<std::size_t>(n));
  bufPos += static_cast<int>(n);
  return static_cast<int>(n);
}

int64_t Buffer_DataReader::size() { return buf == nullptr ? 0 : bufLen; }

void Buffer_DataReader::reset() { bufPos = 0; }

bool Buffer_DataReader::isValid() { return buf != nullptr; }

int Buffer_DataReader::get_bufLen() { return bufLen; }

void Buffer_DataReader::set_bufPos(int pos) {
  if (pos >= 0 && pos < bufLen) {
    bufPos = pos;
  }
}

HeaderBuffer_DataReader::HeaderBuffer_DataReader(void *buf, int len) : Buffer_DataReader(buf, len) {
  if (buf != nullptr && len > HiddenHeaderBytes) {
    bufPos = HiddenHeaderBytes;
  }
}

int64_t HeaderBuffer_DataReader::size() {
  return isValid() ? static_cast<int64_t>(get_bufLen()) - HiddenHeaderBytes : 0;
}

void HeaderBuffer_DataReader::reset() {
  if (isValid() && get_bufLen() > HiddenHeaderBytes) {
    set_bufPos(HiddenHeaderBytes);
  }
}

} // namespace Corvane::Wavemill
