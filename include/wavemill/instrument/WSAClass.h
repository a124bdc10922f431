#pragma once

#include "wavemill/Export.h"

namespace Corvane::Wavemill {

/// Holds one start of the platform's socket library for its lifetime, for
/// code that needs sockets without an instrument session. Starts and ends
/// are counted by the platform, so any thread may make one.
class WAVEMILL_API WSAClass {
public:
  WSAClass();
  ~WSAClass();
  WSAClass(const WSAClass &) = delete;
  WSAClass &operator=(const WSAClass &) = delete;

  /// True when the socket library started.
  bool isStarted() const { return started; }

private:
  bool started;
};

} // namespace Corvane::Wavemill
