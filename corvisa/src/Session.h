#pragma once

#include "MessageEnd.h"
#include "ResourceName.h"
#include "corvisa/corvisa.h"

#include "platform/Socket.h"

#include <cstddef>
#include <memory>
#include <mutex>
#include <vector>

namespace Corvane::Wavemill::CorVisa {

// One open resource: a connected TCP socket, the session's attributes and
// the bytes received beyond what reads have returned. Operations are
// serialised by a mutex of the session; shutdown() may come from any
// thread at any time and wakes an operation that waits.
class Session {
public:
  // Connects to `address` within `timeoutInMS`; null when the host does
  // not resolve or the connection is refused, unreachable or too slow.
  static std::shared_ptr<Session> connect(const ResourceAddress &address, int timeoutInMS);

  explicit Session(Platform::SocketHandle socket);
  ~Session();
  Session(const Session &) = delete;
  Session &operator=(const Session &) = delete;

  // Ends the connection both ways; the socket itself is closed with the
  // session, so a thread still inside an operation never meets a reused
  // descriptor.
  void shutdown();

  ViStatus write(const ViByte *data, ViUInt32 count, ViUInt32 &sent);
  ViStatus read(ViByte *buffer, ViUInt32 count, ViUInt32 &received);
  ViStatus clear();
  ViStatus setAttribute(ViAttr attribute, ViAttrState value);
  ViStatus getAttribute(ViAttr attribute, void *value);

private:
  void applyTimeout();
  std::size_t buffered() const { return input.size() - inputStart; }
  // Hands buffered bytes to the caller, up to the end of a message.
  ViStatus takeBuffered(ViByte *buffer, ViUInt32 count, ViUInt32 &received, bool &done);

  const Platform::SocketHandle socket;
  std::mutex mutex;
  ViUInt32 timeoutInMS = 2000;
  bool sendEnd = true;
  unsigned char termChar = '\n';
  bool termCharEnabled = false;
  MessageEnd messageEnd;
  // Received bytes not yet returned start at inputStart; consuming from the
  // front moves the index instead of the bytes.
  std::vector<unsigned char> input;
  std::size_t inputStart = 0;
};

} // namespace Corvane::Wavemill::CorVisa
