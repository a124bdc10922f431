#pragma once

#include <cstdint>
#include <string>

namespace Corvane::Wavemill::CorVisa {

// The call recorder behind corvisa_record: one line per VISA call, so that
// tests of a VISA client can compare the exact calls it made. Thread-safe.

// Whether calls are being recorded; cheap, so callers can skip formatting.
bool isRecording();
// Adds "<line>\n" to the record while recording.
void recordLine(const std::string &line);
// "0x" and the eight upper-case hex digits of `value`: 0x3FFF001A.
std::string hex8(std::uint32_t value);

} // namespace Corvane::Wavemill::CorVisa
