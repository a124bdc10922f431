#include "Recorder.h"

#include "corvisa/corvisa.h"

#include <atomic>
#include <cstring>
#include <mutex>

namespace Corvane::Wavemill::CorVisa {

namespace {

struct Record {
  std::mutex mutex;
  std::string text;
  std::atomic<bool> on{false};
};

Record &theRecord() {
  // Never destroyed: a client thread may still call in while the process exits.
  static auto *record = new Record;
  return *record;
}

} // namespace

bool isRecording() { return theRecord().on.load(std::memory_order_relaxed); }

void recordLine(const std::string &line) {
  auto &record = theRecord();
  std::lock_guard<std::mutex> lock(record.mutex);
  if (!record.on.load(std::memory_order_relaxed))
    return;
  record.text += line;
  record.text += '\n';
}

std::string hex8(std::uint32_t value) {
  static const char digits[] = "0123456789ABCDEF";
  std::string text = "0x00000000";
  for (int i = 9; i >= 2; --i, value >>= 4)
    text[static_cast<std::size_t>(i)] = digits[value & 0xF];
  return text;
}

} // namespace Corvane::Wavemill::CorVisa

using namespace Corvane::Wavemill::CorVisa;

extern "C" CORVISA_API int corvisa_record(int on) {
  auto &record = theRecord();
  std::lock_guard<std::mutex> lock(record.mutex);
  const bool previous = record.on.load(std::memory_order_relaxed);
  if (on != 0)
    record.text.clear();
  record.on.store(on != 0, std::memory_order_relaxed);
  return previous ? 1 : 0;
}

extern "C" CORVISA_API int corvisa_record_take(char *buffer, int size) {
  auto &record = theRecord();
  std::lock_guard<std::mutex> lock(record.mutex);
  const std::size_t length = record.text.size();
  if (buffer != nullptr && size > 0) {
    const auto capacity = static_cast<std::size_t>(size);
    std::memcpy(buffer, record.text.data(), length < capacity ? length : capacity);
    if (length < capacity)
      buffer[length] = '\0';
  }
  // A record beyond 2 GiB is not expected; the length says "too long" then.
  return length > 0x7FFFFFFF ? 0x7FFFFFFF : static_cast<int>(length);
}
