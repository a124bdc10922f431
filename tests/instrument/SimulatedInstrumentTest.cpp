#include "wavemill/simulator/SimulatedInstrument.h"

#include "platform/Socket.h"

#include <gtest/gtest.h>

#include <chrono>
#include <string>
#include <thread>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// A client on the bare socket layer, so that every byte on the wire is the
// test's own choice.
class RawClient {
public:
  explicit RawClient(int port, int timeoutInMS = 2000) : socket(Platform::openTcpSocket()) {
    Platform::setReceiveTimeout(socket, timeoutInMS);
    connected = Platform::connectIPv4(socket, "127.0.0.1", port) == 0;
  }
  ~RawClient() { Platform::closeSocket(socket); }

  void send(const std::string &bytes) { Platform::sendAll(socket, bytes.data(), bytes.size()); }
  // One answer line without its line feed; empty on a time-out.
  std::string line() {
    std::string answer;
    for (char c = 0; Platform::receiveBytes(socket, &c, 1) == 1 && c != '\n';)
      answer += c;
    return answer;
  }
  // Everything that comes until a time-out or the end of the stream.
  std::string rest() {
    std::string bytes;
    char c = 0;
    long received = 0;
    while ((received = Platform::receiveBytes(socket, &c, 1)) == 1)
      bytes += c;
    ended = received == 0;
    return bytes;
  }

  Platform::SocketHandle socket;
  bool connected = false;
  bool ended = false;
};

} // namespace

TEST(SimulatedInstrumentTest, EveryLineEndAndCaseOfHeaderIsUnderstoodAndUnknownQueriesQueueErrors) {
  SimulatedInstrument instrument;
  RawClient client(instrument.getPort());
  ASSERT_TRUE(client.connected);
  const std::string undefined = "-113,\"Undefined header\"", noError = "0,\"No error\"";
  const struct {
    const char *sent;
    std::vector<std::string> answers;
  } rows[] = {
      {"*idn?\r\n", {"Corvane,SG200,100123,1.4.2"}},
      {"*OPT?\n\r", {"B10,B22,K20,K24"}},
      {"FREQ 1e9\r:freq?\r", {"1e9"}},
      {"sour1:pow? min\n", {"-130"}},
      {"SOUR1:FREQ? MAX\n", {"6000000000"}},
      // Had either unknown query answered, "1" would not be the first line.
      {"BOGUS?\nVOLT?\n*OPC?\n", {"1"}},
      {"SYST:ERR?\nsystem:error?\nSYST:ERR?\n", {undefined, undefined, noError}},
      {"NONE?\n*CLS\nSYST:ERR?\n", {noError}},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.sent);
    client.send(row.sent);
    for (const auto &answer : row.answers)
      EXPECT_EQ(client.line(), answer);
  }
  EXPECT_EQ(instrument.getValue("Freq"), "1e9");
  // The second byte of each two-byte terminator is no command of its own.
  EXPECT_EQ(instrument.getCommands().size(), 15u);
}

// Several clients at once with shared state: the fault test stores a block
// through one connection and reads it through another while the first is open.

// Blocks read back go through the session tests, those of many megabytes
// through the LAN session tests.
TEST(SimulatedInstrumentTest, BlocksAreRecordedByTheirHeaderAndResetForgetsThem) {
  SimulatedInstrument instrument;
  RawClient client(instrument.getPort());
  client.send("MMEM:DATA 'w',#15a\nb#c\n\rSOUR:WAV:DATA #15a\nb#c\n\r*OPC?\n");
  EXPECT_EQ(client.line(), "1");
  EXPECT_EQ(instrument.getCommands(), (std::vector<std::string>{"MMEM:DATA 'w',", "SOUR:WAV:DATA", "*OPC?"}));

  client.send("*RST\nMMEM:DATA? 'w'\nSYST:ERR?\n");
  EXPECT_EQ(client.line(), "-113,\"Undefined header\"");
  EXPECT_TRUE(instrument.getBlock("w").empty());
}

TEST(SimulatedInstrumentTest, FaultsBreakAnswersTheWayTheyAnnounce) {
  SimulatedInstrument instrument;
  const struct {
    SimulatorFault fault;
    const char *received;
    bool closed;
  } rows[] = {
      {SimulatorFault::Trickle, "#2100123456789\n", false}, {SimulatorFault::NoTerminator, "#2100123456789", false},
      {SimulatorFault::GarbageBlock, "garbage\n", false},   {SimulatorFault::ShortBlock, "#21001234", false},
      {SimulatorFault::CloseMidBlock, "#21001234", true},   {SimulatorFault::Stall, "", false},
      {SimulatorFault::RefuseConnections, "", true},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(toString(row.fault));
    instrument.setFault(SimulatorFault::None);
    RawClient client(instrument.getPort(), 300);
    client.send("MMEM:DATA 'w',#2100123456789\n");
    client.send("*OPC?\n");
    EXPECT_EQ(client.line(), "1"); // the block is stored before the fault applies
    instrument.setFault(row.fault);
    if (row.fault == SimulatorFault::RefuseConnections) {
      RawClient refused(instrument.getPort(), 300);
      EXPECT_EQ(refused.rest(), "");
      EXPECT_TRUE(refused.ended);
      continue;
    }
    client.send("MMEM:DATA? 'w'\n");
    EXPECT_EQ(client.rest(), row.received);
    EXPECT_EQ(client.ended, row.closed);
  }
}

TEST(SimulatedInstrumentTest, StopReturnsPromptlyWhileClientsWaitOrTrickle) {
  SimulatedInstrument instrument;
  RawClient stalled(instrument.getPort());
  RawClient trickled(instrument.getPort());
  trickled.send("MMEM:DATA 'w',#45000" + std::string(5000, 'x') + "\n*OPC?\n");
  EXPECT_EQ(trickled.line(), "1");
  instrument.setFault(SimulatorFault::Trickle);
  trickled.send("MMEM:DATA? 'w'\n"); // about 33 s of pieces
  char piece[3];
  ASSERT_GT(Platform::receiveBytes(trickled.socket, piece, sizeof piece), 0); // the trickle is under way
  instrument.setFault(SimulatorFault::Stall);
  stalled.send("*IDN?\n");

  const auto start = std::chrono::steady_clock::now();
  instrument.stop();
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(1000));
  EXPECT_EQ(RawClient(instrument.getPort(), 300).connected, false);
}
