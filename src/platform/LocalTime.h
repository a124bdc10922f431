#pragma once

#include <ctime>

namespace Corvane::Wavemill::Platform {

// Converts `time` to the local calendar time of the process's time zone;
// false, with `result` unspecified, when the system cannot. Reentrant, unlike
// std::localtime.
bool toLocalTime(std::time_t time, std::tm &result);

} // namespace Corvane::Wavemill::Platform
