#include "wavemill/waveform/DataWriter.h"

#include "wavemill/waveform/DynamicBuffer.h"

#include <climits>
#include <cstdint>

namespace Corvane::Wavemill {

DataWriter::~DataWriter() = default;

Buffer_DataWriter::Buffer_DataWriter(DynamicBuffer *buffer) : buffer(buffer) {}

void Buffer_DataWriter::reset() {
  if (buffer != nullptr) {
    buffer->reset();
  }
}

bool Buffer_DataWriter::isValid() { return buffer != nullptr; }

int Buffer_DataWriter::write(void *src, int size, int count) {
  const int64_t bytes = static_cast<int64_t>(size) * count;
  if (buffer == nullptr || bytes <= 0 || bytes > INT_MAX) {
    return 0;
  }
  return buffer->append(static_cast<unsigned char *>(src), static_cast<int>(bytes)) == 0 ? 0 : count;
}

int Buffer_DataWriter::size() { return buffer == nullptr ? 0 : buffer->size(); }

} // namespace Corvane::Wavemill
