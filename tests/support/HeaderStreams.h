#pragma once

#include "wavemill/waveform/DataReader.h"
#include "wavemill/waveform/DataWriter.h"
#include "wavemill/waveform/DynamicBuffer.h"

#include <algorithm>
#include <cstring>
#include <vector>

namespace Corvane::Wavemill::Testing {

/// Reads a copy of `bytes` (a heap block of their exact length, so the
/// sanitizer sees reads past them) and counts items as fread does.
class ItemReader : public DataReader {
public:
  explicit ItemReader(const std::vector<unsigned char> &bytes) : bytes_(bytes) {}
  int read(void *dest, int size, int count) override {
    const std::size_t want = static_cast<std::size_t>(size) * static_cast<std::size_t>(count);
    const std::size_t take = std::min(want, bytes_.size() - pos_);
    if (take > 0) {
      std::memcpy(dest, bytes_.data() + pos_, take);
    }
    pos_ += take;
    return take == want && want > 0 ? count : 0;
  }
  int64_t size() override { return static_cast<int64_t>(bytes_.size()); }
  void reset() override { pos_ = 0; }
  bool isValid() override { return true; }

private:
  std::vector<unsigned char> bytes_;
  std::size_t pos_ = 0;
};

/// Collects what is written in 1024-byte blocks, counting items as fwrite
/// does; `closes` counts the finishing calls.
class ItemWriter : public Buffer_DataWriter {
public:
  ItemWriter() : Buffer_DataWriter(&store_) {}
  int write(const void *src, int size, int count) override {
    return Buffer_DataWriter::write(const_cast<void *>(src), size, count);
  }
  bool close() override {
    ++closes;
    return true;
  }
  std::vector<unsigned char> bytes() {
    std::vector<unsigned char> out(static_cast<std::size_t>(store_.size()));
    store_.copyTo(out.data());
    return out;
  }
  int closes = 0;

private:
  DynamicBuffer store_{1024};
};

} // namespace Corvane::Wavemill::Testing
