#include "wavemill/instrument/WSAClass.h"

#include "platform/Network.h"

namespace Corvane::Wavemill {

WSAClass::WSAClass() : started(Platform::startSockets()) {}

WSAClass::~WSAClass() {
  if (started)
    Platform::stopSockets();
}

} // namespace Corvane::Wavemill
