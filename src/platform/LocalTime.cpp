#include "platform/LocalTime.h"

#include <time.h>

namespace Corvane::Wavemill::Platform {

bool toLocalTime(std::time_t time, std::tm &result) {
#if defined(_WIN32)
  return localtime_s(&result, &time) == 0;
#else
  return localtime_r(&time, &result) != nullptr;
#endif
}

} // namespace Corvane::Wavemill::Platform
