#include "wavemill/simulator/SimulatedInstrument.h"

#include "platform/Socket.h"
#include "simulator/ClientSession.h"
#include "simulator/InstrumentState.h"

#include <atomic>
#include <charconv>
#include <chrono>
#include <iterator>
#include <list>
#include <mutex>
#include <stdexcept>
#include <thread>
#include <utility>

namespace Corvane::Wavemill {

namespace {

constexpr std::pair<SimulatorFault, const char *> faultNames[] = {
    {SimulatorFault::None, "none"},
    {SimulatorFault::Stall, "stall"},
    {SimulatorFault::CloseMidBlock, "close-mid-block"},
    {SimulatorFault::GarbageBlock, "garbage-block"},
    {SimulatorFault::Trickle, "trickle"},
    {SimulatorFault::ShortBlock, "short-block"},
    {SimulatorFault::NoTerminator, "no-terminator"},
    {SimulatorFault::RefuseConnections, "refuse"},
};

// The accept loop looks at the stop flag this often.
constexpr int acceptWaitInMS = 100;
// A client that takes no byte of an answer for this long is given up; a
// shutdown from stop() ends a waiting send sooner.
constexpr int sendTimeoutInMS = 10000;
constexpr int listenBacklog = 16;

std::string decimal(int value) {
  char text[16];
  const auto written = std::to_chars(text, text + sizeof text, value);
  return std::string(text, written.ptr);
}

} // namespace

bool parseSimulatorFault(const std::string &name, SimulatorFault &fault) {
  for (const auto &[value, text] : faultNames)
    if (name == text) {
      fault = value;
      return true;
    }
  return false;
}

std::string toString(SimulatorFault fault) {
  for (const auto &[value, text] : faultNames)
    if (value == fault)
      return text;
  return "none";
}

struct SimulatedInstrument::Impl {
  // One connection. Its socket is closed only by whoever joins its thread,
  // so a shutdown from stop() never meets a handle number already reused.
  struct Client {
    Platform::SocketHandle socket = Platform::noSocket;
    std::thread thread;
    std::atomic<bool> done{false};
  };

  explicit Impl(const SimulatorOptions &options) : state(options), host(options.host) {}

  void acceptLoop();
  void serve(Platform::SocketHandle socket);
  void reapFinished();

  Simulator::InstrumentState state;
  std::string host;
  int port = 0;
  Platform::SocketHandle listener = Platform::noSocket;
  std::atomic<bool> stopping{false};
  std::atomic<std::size_t> connections{0};
  std::thread acceptThread;

  std::mutex clientsMutex;
  std::list<std::unique_ptr<Client>> clients;

  std::mutex stopMutex;
  bool stopped = false;
};

void SimulatedInstrument::Impl::acceptLoop() {
  while (!stopping.load()) {
    reapFinished();
    const int ready = Platform::waitReadable(listener, acceptWaitInMS);
    if (ready < 0) {
      // A failing wait would otherwise spin; the next round may succeed.
      std::this_thread::sleep_for(std::chrono::milliseconds(acceptWaitInMS));
      continue;
    }
    if (ready == 0)
      continue;
    const Platform::SocketHandle socket = Platform::acceptClient(listener);
    if (socket == Platform::noSocket)
      continue;
    connections.fetch_add(1);
    if (state.fault.load() == SimulatorFault::RefuseConnections) {
      Platform::closeSocket(socket);
      continue;
    }
    serve(socket);
  }
}

void SimulatedInstrument::Impl::serve(Platform::SocketHandle socket) {
  Platform::setSendTimeout(socket, sendTimeoutInMS);
  auto client = std::make_unique<Client>();
  Client *served = client.get();
  served->socket = socket;
  try {
    served->thread = std::thread([this, served] {
      try {
        Simulator::ClientSession(served->socket, state, stopping).run();
      } catch (...) {
        // Out of memory for a block, say: this connection ends, the
        // simulator and its other clients go on.
      }
      served->done.store(true);
    });
  } catch (const std::system_error &) {
    // No thread to be had: the client is turned away.
    Platform::closeSocket(socket);
    return;
  }
  std::lock_guard<std::mutex> lock(clientsMutex);
  clients.push_back(std::move(client));
}

void SimulatedInstrument::Impl::reapFinished() {
  std::list<std::unique_ptr<Client>> finished;
  {
    std::lock_guard<std::mutex> lock(clientsMutex);
    for (auto it = clients.begin(); it != clients.end();) {
      const auto current = it++;
      if ((*current)->done.load())
        finished.splice(finished.end(), clients, current);
    }
  }
  for (auto &client : finished) {
    client->thread.join();
    Platform::closeSocket(client->socket);
  }
}

SimulatedInstrument::SimulatedInstrument(SimulatorOptions options) : impl(std::make_unique<Impl>(options)) {
  impl->listener = Platform::listenTcp(options.host, options.port, listenBacklog);
  if (impl->listener == Platform::noSocket)
    throw std::runtime_error("cannot listen on " + options.host + ":" + decimal(options.port) + ": " +
                             Platform::socketErrorText(Platform::lastSocketError()));
  impl->port = Platform::localPort(impl->listener);
  try {
    impl->acceptThread = std::thread([this] { impl->acceptLoop(); });
  } catch (...) {
    Platform::closeSocket(impl->listener);
    throw;
  }
}

SimulatedInstrument::~SimulatedInstrument() { stop(); }

void SimulatedInstrument::stop() {
  std::lock_guard<std::mutex> guard(impl->stopMutex);
  if (impl->stopped)
    return;
  impl->stopped = true;
  impl->stopping.store(true);
  // The accept loop ends first, so that no client is added after the list
  // has been taken below.
  if (impl->acceptThread.joinable())
    impl->acceptThread.join();
  Platform::closeSocket(impl->listener);
  impl->listener = Platform::noSocket;

  std::list<std::unique_ptr<Impl::Client>> all;
  {
    std::lock_guard<std::mutex> lock(impl->clientsMutex);
    all.swap(impl->clients);
  }
  // A shutdown wakes a thread that waits in a receive or a send.
  for (auto &client : all)
    Platform::shutdownBoth(client->socket);
  for (auto &client : all) {
    client->thread.join();
    Platform::closeSocket(client->socket);
  }
}

int SimulatedInstrument::getPort() const { return impl->port; }

std::string SimulatedInstrument::getAddress() const {
  return "TCPIP0::" + impl->host + "::" + decimal(impl->port) + "::SOCKET";
}

void SimulatedInstrument::setFault(SimulatorFault fault) { impl->state.fault.store(fault); }

SimulatorFault SimulatedInstrument::getFault() const { return impl->state.fault.load(); }

void SimulatedInstrument::setIdentity(const std::string &identity) { impl->state.setIdentity(identity); }

void SimulatedInstrument::setOptions(const std::string &options) { impl->state.setOptions(options); }

std::vector<std::string> SimulatedInstrument::getCommands() const { return impl->state.commands(); }

void SimulatedInstrument::clearCommands() { impl->state.clearCommands(); }

void SimulatedInstrument::setRecording(bool on) { impl->state.setRecording(on); }

std::string SimulatedInstrument::getRecordedBytes() const { return impl->state.recordedBytes(); }

std::string SimulatedInstrument::getValue(const std::string &header) const {
  std::string key = Simulator::upperCase(header);
  if (!key.empty() && key.front() == ':')
    key.erase(0, 1);
  return impl->state.value(key).value_or(std::string());
}

std::vector<unsigned char> SimulatedInstrument::getBlock(const std::string &name) const {
  const auto block = impl->state.block(name);
  return block ? *block : std::vector<unsigned char>();
}

std::size_t SimulatedInstrument::getConnectionCount() const { return impl->connections.load(); }

} // namespace Corvane::Wavemill
