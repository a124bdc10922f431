#include "platform/Signals.h"

#include <pthread.h>
#include <signal.h>

#include <cerrno>

namespace Corvane::Wavemill::Platform {

namespace {

sigset_t terminationSignals() {
  sigset_t set;
  sigemptyset(&set);
  sigaddset(&set, SIGINT);
  sigaddset(&set, SIGTERM);
  return set;
}

} // namespace

bool blockTerminationSignals() {
  const sigset_t set = terminationSignals();
  return ::pthread_sigmask(SIG_BLOCK, &set, nullptr) == 0;
}

int waitForTerminationSignal() {
  const sigset_t set = terminationSignals();
  sigset_t current;
  if (::pthread_sigmask(SIG_BLOCK, nullptr, &current) != 0 || sigismember(&current, SIGINT) != 1 ||
      sigismember(&current, SIGTERM) != 1)
    return -1;
  for (;;) {
    int signal = 0;
    const int result = ::sigwait(&set, &signal);
    if (result == 0)
      return signal;
    // sigwait reports errors by result; EINTR is not among POSIX's, but some
    // systems return it when another handler ran, and the wait goes on then.
    if (result != EINTR)
      return -1;
  }
}

} // namespace Corvane::Wavemill::Platform
