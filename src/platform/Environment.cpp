#include "platform/Environment.h"

#include <cstdlib>
#include <cstring>

namespace Corvane::Wavemill::Platform {

std::string environmentVariable(const char *name) {
  if (name == nullptr)
    return {};
  const char *value = std::getenv(name);
  return value == nullptr ? std::string() : std::string(value);
}

bool setEnvironmentVariable(const char *name, const std::string &value) {
  // setenv refuses these too, but only after it has looked at them; say no first.
  if (name == nullptr || *name == '\0' || std::strchr(name, '=') != nullptr)
    return false;
  return ::setenv(name, value.c_str(), 1) == 0;
}

} // namespace Corvane::Wavemill::Platform
