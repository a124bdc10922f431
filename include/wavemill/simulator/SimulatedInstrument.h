#pragma once

#include "wavemill/simulator/SimulatorExport.h"

#include <cstddef>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace Corvane::Wavemill {

/// What the simulated instrument does wrong on purpose, to show how a
/// client copes with a misbehaving device.
enum class SimulatorFault {
  /// Answers as an instrument should.
  None,
  /// Reads commands but never answers.
  Stall,
  /// Closes the connection in the middle of a block answer: the block
  /// header and half of the bytes go out, then the connection ends. Text
  /// answers are not affected.
  CloseMidBlock,
  /// Answers a block query with the text line "garbage" instead of a block.
  GarbageBlock,
  /// Sends every answer in pieces of 3 bytes with about 20 ms between them.
  Trickle,
  /// Announces a block longer than the bytes it sends: the header and half
  /// of the bytes go out, then the connection stays open and silent (it
  /// still reads commands but answers none of them).
  ShortBlock,
  /// Sends answers without their line feed, block answers included.
  NoTerminator,
  /// Closes every connection as soon as it is accepted.
  RefuseConnections,
};

/// Reads the name of a fault as the `wavemill` tool spells it: "none",
/// "stall", "close-mid-block", "garbage-block", "trickle", "short-block",
/// "no-terminator", "refuse". Returns false for an unknown name and leaves
/// `fault` unchanged then. Names are compared exactly (lower case).
WAVEMILL_SIMULATOR_API bool parseSimulatorFault(const std::string &name, SimulatorFault &fault);

/// The name parseSimulatorFault reads: SimulatorFault::ShortBlock ->
/// "short-block".
WAVEMILL_SIMULATOR_API std::string toString(SimulatorFault fault);

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
  /// The fault from the start; SimulatedInstrument::setFault changes it.
  SimulatorFault fault = SimulatorFault::None;
  /// The limits "HEADER? MIN" and "HEADER? MAX" answer, by header as the
  /// client writes it, compared without regard to case.
  std::map<std::string, std::pair<double, double>> ranges = {
      {"FREQ", {1e6, 6e9}}, {"POW", {-130.0, 20.0}}, {"SOUR1:FREQ", {1e6, 6e9}}, {"SOUR1:POW", {-130.0, 20.0}}};
  /// What "HEADER?" answers before a command stores a value, and again
  /// after "*RST": the instrument's preset state, by header as the client
  /// writes it, compared without regard to case.
  std::map<std::string, std::string> values = {{"FREQ", "1000000000"}, {"SOUR1:FREQ", "1000000000"},
                                               {"POW", "-10"},         {"SOUR1:POW", "-10"},
                                               {"OUTP", "0"},          {"OUTP1", "0"}};
};

/// A SCPI instrument on a TCP socket, for tests, demos and users without
/// hardware. It listens on 127.0.0.1, serves any number of clients at once
/// on threads of its own, and stops from its destructor.
///
/// Commands end with LF, CR LF or LF CR; empty lines are skipped, headers
/// are compared without regard to case, and one leading ":" is ignored.
/// Answers end with a line feed.
///
/// - "*IDN?", "*OPT?" answer the identity and the options; "*OPC?" answers
///   1; "*RST" returns every value to its preset and forgets the blocks; "*CLS" empties the
///   error queue.
/// - "SYST:ERR?" (or "SYSTEM:ERROR?") answers the oldest entry of the error
///   queue, or 0,"No error" when it is empty. The queue keeps at most 32
///   entries, as a small instrument does; later errors are dropped.
/// - "HEADER value" stores `value` under the upper-cased header; "HEADER?"
///   answers it: "FREQ 1e9" then "freq?" -> "1e9".
/// - "HEADER? MIN" and "HEADER? MAX" answer the range of the header in the
///   form of printf's %.15g in the "C" locale: "POW? MIN" -> "-130",
///   "FREQ? MAX" -> "6000000000", 1e20 -> "1e+20".
/// - "MMEM:DATA 'name',#<d><len><bytes>" stores a definite-length block of
///   any size under `name`; "MMEM:DATA? 'name'" answers
///   "#<d><len><bytes>" and a line feed. A block sent with a bare header
///   ("SOUR:WAV:DATA #...") is stored under the upper-cased header and read
///   back with "SOUR:WAV:DATA?".
/// - A query it cannot answer (an unknown header, a header never set, a
///   block never stored) pushes -113,"Undefined header" and, like a real
///   instrument, answers nothing: the client's read runs into its time-out.
///   A malformed block header pushes -161,"Invalid block data".
///
/// All operations are thread-safe and may be called while clients are
/// connected; nothing blocks without limit.
class WAVEMILL_SIMULATOR_API SimulatedInstrument {
public:
  /// Starts listening at once; throws std::runtime_error ("cannot listen on
  /// 127.0.0.1:5025: Address already in use") when the port cannot be had.
  explicit SimulatedInstrument(SimulatorOptions options = {});
  /// Calls stop(): closes every connection and joins the threads.
  ~SimulatedInstrument();
  SimulatedInstrument(const SimulatedInstrument &) = delete;
  SimulatedInstrument &operator=(const SimulatedInstrument &) = delete;

  /// The port it listens on; the chosen one when the options asked for 0.
  int getPort() const;
  /// "TCPIP0::127.0.0.1::<port>::SOCKET", the address a client gives.
  std::string getAddress() const;

  /// Switches the fault for answers given from now on, also on connections
  /// already open.
  void setFault(SimulatorFault fault);
  /// The fault in force.
  SimulatorFault getFault() const;
  /// Changes the answer to "*IDN?" from now on.
  void setIdentity(const std::string &identity);
  /// Changes the answer to "*OPT?" from now on.
  void setOptions(const std::string &options);

  /// The command lines received so far, oldest first, without terminator;
  /// a block command shows as its text before "#" ("MMEM:DATA 'w',"). The
  /// latest 65536 lines are kept, so a long-running simulator does not grow
  /// without end.
  std::vector<std::string> getCommands() const;
  /// Forgets the command lines received so far.
  void clearCommands();
  /// Keeps every byte received from now on, terminators and block bytes
  /// included, for checks of what exactly went over the wire. Off at start,
  /// so that large blocks are not held twice. Switching it on starts a new
  /// recording.
  void setRecording(bool on);
  /// The bytes kept while recording, in the order they arrived.
  std::string getRecordedBytes() const;
  /// The value stored under `header` by a command ("freq" finds what
  /// "FREQ 1e9" stored), empty if none.
  std::string getValue(const std::string &header) const;
  /// A copy of the block stored under `name` by MMEM:DATA (or under the
  /// upper-cased header of a bare block command); empty if none.
  std::vector<unsigned char> getBlock(const std::string &name) const;
  /// How many connections were accepted so far, refused ones included.
  std::size_t getConnectionCount() const;

  /// Stops listening, shuts every connection down and joins the threads;
  /// returns within a few hundred milliseconds whatever the clients do.
  /// Safe to call twice and from several threads.
  void stop();

private:
  struct Impl;
  std::unique_ptr<Impl> impl;
};

} // namespace Corvane::Wavemill
