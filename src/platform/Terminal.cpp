#include "platform/Terminal.h"

#include <unistd.h>

namespace Corvane::Wavemill::Platform {

bool isTerminal(StandardStream stream) {
  const int descriptor = stream == StandardStream::Input    ? STDIN_FILENO
                         : stream == StandardStream::Output ? STDOUT_FILENO
                                                            : STDERR_FILENO;
  return isatty(descriptor) == 1;
}

} // namespace Corvane::Wavemill::Platform
