#pragma once

#include "wavemill/waveform/DataReader.h"
#include "wavemill/waveform/DataWriter.h"
#include "wavemill/waveform/DynamicBuffer.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

namespace Corvane::Wavemill::Testing {

/// The bytes spelled in hex; blanks only separate fields.
inline std::vector<unsigned char> hex(const char *text) {
  std::vector<unsigned char> out;
  for (; *text != '\0'; ++text) {
    if (*text != ' ') {
      out.push_back(static_cast<unsigned char>(std::stoi(std::string(text, 2), nullptr, 16)));
      ++text;
    }
  }
  return out;
}

struct HeldBytes {
  std::vector<unsigned char> held;
};

/// Reads a copy of `bytes` (a heap block of their exact length, so the
/// sanitizer sees reads past them) and counts items as fread does.
class ItemReader : HeldBytes, public Buffer_DataReader {
public:
  explicit ItemReader(const std::vector<unsigned char> &bytes)
      : HeldBytes{bytes}, Buffer_DataReader(held.data(), static_cast<int>(held.size())) {}
  int read(void *dest, int size, int count) override {
    const int n = Buffer_DataReader::read(dest, size, count);
    return n > 0 && n == static_cast<int64_t>(size) * count ? count : 0;
  }
};

/// Collects what is written in 1024-byte blocks, counting items as fwrite
/// does.
class ItemWriter : public Buffer_DataWriter {
public:
  ItemWriter() : Buffer_DataWriter(&store_) {}
  int write(const void *src, int size, int count) override {
    return Buffer_DataWriter::write(const_cast<void *>(src), size, count);
  }
  bool close() override { return true; }
  std::vector<unsigned char> bytes() {
    std::vector<unsigned char> out(static_cast<std::size_t>(store_.size()));
    store_.copyTo(out.data());
    return out;
  }

private:
  DynamicBuffer store_{1024};
};

/// What `header` writes, the write expected to succeed.
template <typename Header> std::vector<unsigned char> written(Header &header) {
  ItemWriter writer;
  EXPECT_TRUE(header.write(&writer));
  return writer.bytes();
}

} // namespace Corvane::Wavemill::Testing
