#pragma once

#include "platform/Socket.h"
#include "simulator/InstrumentState.h"

#include <atomic>
#include <cstddef>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill::Simulator {

// One client of the simulated instrument, served on a thread of its own:
// reads command lines and blocks from the socket, carries them out on the
// shared state and answers as the fault in force says. The socket belongs to
// the caller, who closes it after run() has returned.
class ClientSession {
public:
  ClientSession(Platform::SocketHandle socket, InstrumentState &state, const std::atomic<bool> &stopping);

  // Serves until the client leaves, a transfer fails, a fault ends the
  // connection, or `stopping` is set and the socket is shut down.
  void run();

private:
  bool fill();
  bool readLine(std::string &line, bool &blockFollows);
  bool receiveBlock(const std::string &command);
  bool execute(const std::string &command);
  bool answerText(const std::string &text);
  bool answerBlock(const std::shared_ptr<const Block> &block);
  bool send(const void *data, std::size_t size, SimulatorFault fault);
  void undefinedHeader();

  Platform::SocketHandle socket;
  InstrumentState &state;
  const std::atomic<bool> &stopping;
  std::vector<char> buffer;
  std::size_t begin = 0;
  std::size_t end = 0;
  // Set once a short block went out: the client waits for bytes that never
  // come, and nothing else may arrive in their place.
  bool muted = false;
};

} // namespace Corvane::Wavemill::Simulator
