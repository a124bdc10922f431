#pragma once

#include <cstddef>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// What the simulated instrument does wrong on purpose, to show how a
/// client copes with a misbehaving device.
enum class SimulatorFault {
  /// Answers as an instrument should.
  None,
  /// Reads commands but never answers.
  Stall,
  /// Closes the connection in the middle of a block answer.
  CloseMidBlock,
  /// Answers a block query with a text line instead of a block.
  GarbageBlock,
  /// Sends every answer in small pieces with pauses between them.
  Trickle,
  /// Announces a block longer than the bytes it sends, then waits.
  ShortBlock,
  /// Sends answers without their line feed.
  NoTerminator,
  /// Closes every connection as soon as it is accepted.
  RefuseConnections,
};

/// The names of the faults as the `wavemill` tool spells them ("none",
/// "stall", "close-mid-block", "garbage-block", "trickle", "short-block",
/// "no-terminator", "refuse"); false for an unknown name.
bool parseSimulatorFault(const std::string &name, SimulatorFault &fault);
std::string toString(SimulatorFault fault);

/// How a simulated instrument starts.
struct SimulatorOptions {
  /// The answer to "*IDN?".
  std::string identity = "Corvane,SG200,100123,1.4.2";
  /// The answer to "*OPT?".
  std::string options = "B10,B22,K20,K24";
  /// The address to listen on; only loopback addresses make sense.
  std::string host = "127.0.0.1";
  /// The TCP port; 0 picks a free one (see SimulatedInstrument::getPort).
  int port = 0;
  SimulatorFault fault = SimulatorFault::None;
  /// The limits "HEADER? MIN" and "HEADER? MAX" answer, by header as the
  /// client writes it, compared without regard to case.
  std::map<std::string, std::pair<double, double>> ranges = {
      {"FREQ", {1e6, 6e9}}, {"POW", {-130.0, 20.0}}, {"SOUR1:FREQ", {1e6, 6e9}}, {"SOUR1:POW", {-130.0, 20.0}}};
};

/// A SCPI instrument on a TCP socket, for tests, demos and users without
/// hardware. It listens on 127.0.0.1, serves any number of clients at once
/// on threads of its own, and stops from its destructor.
///
/// It answers "*IDN?", "*OPT?", "*OPC?" (1), "*RST" and "*CLS", and keeps
/// an error queue read by "SYST:ERR?" (unknown queries push -113,"Undefined
/// header"; an empty queue answers 0,"No error"). Any "HEADER value" is
/// stored and answered by "HEADER?"; "HEADER? MIN" and "HEADER? MAX" answer
/// from the ranges. "MMEM:DATA 'name',#..." stores a definite-length block
/// of any size and "MMEM:DATA? 'name'" returns it. Answers end with a line
/// feed; commands may end with LF, CR LF or LF CR.
class SimulatedInstrument {
public:
  /// Starts listening at once; throws std::runtime_error when the port
  /// cannot be had.
  explicit SimulatedInstrument(SimulatorOptions options = {});
  /// Closes every connection and joins the threads.
  ~SimulatedInstrument();
  SimulatedInstrument(const SimulatedInstrument &) = delete;
  SimulatedInstrument &operator=(const SimulatedInstrument &) = delete;

  /// The port it listens on.
  int getPort() const;
  /// "TCPIP0::127.0.0.1::<port>::SOCKET", the address a client gives.
  std::string getAddress() const;

  /// Switches the fault for answers given from now on.
  void setFault(SimulatorFault fault);
  SimulatorFault getFault() const;
  void setIdentity(const std::string &identity);
  void setOptions(const std::string &options);

  /// Every command line received so far, without terminator, block bytes
  /// left out (a block command shows as its text up to "#").
  std::vector<std::string> getCommands() const;
  void clearCommands();
  /// Keeps every byte received from now on, terminators and block bytes
  /// included, for checks of what exactly went over the wire. Off at start,
  /// so that large blocks are not held twice.
  void setRecording(bool on);
  /// The bytes kept while recording, in the order they arrived.
  std::string getRecordedBytes() const;
  /// The value stored under `header` by a command, empty if none.
  std::string getValue(const std::string &header) const;
  /// The block stored under `name` by MMEM:DATA.
  std::vector<unsigned char> getBlock(const std::string &name) const;
  /// How many connections were accepted so far.
  std::size_t getConnectionCount() const;

  /// Stops listening and closes every connection; the destructor does it
  /// too. Safe to call twice.
  void stop();

private:
  struct Impl;
  std::unique_ptr<Impl> impl;
};

} // namespace Corvane::Wavemill
