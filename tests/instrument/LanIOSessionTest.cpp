#include "wavemill/instrument/LanIOSession.h"

#include "platform/Socket.h"
#include "support/ExpectThrow.h"
#include "wavemill/services/LogBase.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include <gtest/gtest.h>

#include <chrono>
#include <thread>

using namespace Corvane::Wavemill;
using Testing::thrownMessage;
using Clock = std::chrono::steady_clock;

namespace {

// Accepts one client and sends it `pieces`, pausing after each so that each
// arrives as a receive of its own; then ends its side and reads until the
// client closes. The exact packet boundaries that the simulated instrument
// does not promise.
class ScriptedServer {
public:
  explicit ScriptedServer(std::vector<std::string> pieces)
      : listener(Platform::listenTcp("127.0.0.1", 0, 1)), thread([this, pieces] { serve(pieces); }) {}
  ~ScriptedServer() {
    thread.join();
    Platform::closeSocket(listener);
  }
  int port() const { return Platform::localPort(listener); }

private:
  void serve(const std::vector<std::string> &pieces) {
    if (Platform::waitReadable(listener, 5000) != 1)
      return;
    const auto client = Platform::acceptClient(listener);
    for (const auto &piece : pieces) {
      Platform::sendAll(client, piece.data(), piece.size());
      std::this_thread::sleep_for(std::chrono::milliseconds(40));
    }
    Platform::shutdownSend(client);
    char buffer[256];
    while (Platform::waitReadable(client, 5000) == 1 && Platform::receiveBytes(client, buffer, sizeof buffer) > 0) {
    }
    Platform::closeSocket(client);
  }

  Platform::SocketHandle listener;
  std::thread thread;
};

// The texts written to the channel "Log" while it lives.
struct LogProbe {
  LogProbe()
      : subscription(LogBase::get("Log")->getSubject().get_observable().subscribe(
            [this](LogMessage *message) { texts.push_back(message->text); })) {}
  ~LogProbe() { subscription.unsubscribe(); }
  std::vector<std::string> texts;
  rx::subscription subscription;
};

std::vector<unsigned char> bytes(const std::string &text) { return {text.begin(), text.end()}; }

} // namespace

TEST(LanIOSessionTest, ReadLineKeepsFullBuffersAndDropsShortPiecesWithoutEnd) {
  const struct {
    const char *name;
    std::vector<std::string> pieces;
    std::string line;
  } cases[] = {
      {"CR LF in one piece", {"Corvane,SG200\r\n"}, "Corvane,SG200"},
      {"short piece without end", {"stray", "second\n"}, "second"},
      {"full buffer without end", {std::string(8192, 'a'), "b\n"}, std::string(8192, 'a') + "b"},
      {"two lines in one piece", {"1\n2\n"}, "1\n2"},
      {"zero byte ends", {std::string("ok\0", 3)}, "ok"},
      {"stream ends without line end", {"cut"}, ""},
  };
  for (const auto &row : cases) {
    SCOPED_TRACE(row.name);
    ScriptedServer server(row.pieces);
    LanIOSession session("127.0.0.1", server.port());
    ASSERT_TRUE(session.connect());
    EXPECT_EQ(session.readLine(), row.line);
  }
}

TEST(LanIOSessionTest, ReadBlockTakesTheAnnouncedBytesOrGivesUpTheConnection) {
  const struct {
    const char *name;
    std::vector<std::string> pieces;
    std::string block;
    bool connectedAfter;
  } cases[] = {
      {"one digit, five bytes", {"#15ab\ncd\n"}, "ab\ncd", true},
      {"body in two pieces", {"#15ab", "cde\n"}, "abcde", true},
      {"digit count 0 reads on", {"#0\n"}, "", true},
      {"length 0", {"#10\n"}, "", true},
      {"short body", {"#3100", "ab"}, "", false},
      {"length is no number", {"#2x1abc\n"}, "", false},
  };
  for (const auto &row : cases) {
    SCOPED_TRACE(row.name);
    ScriptedServer server(row.pieces);
    LanIOSession session("127.0.0.1", server.port());
    ASSERT_TRUE(session.connect());
    EXPECT_EQ(session.readBlock("DATA?"), bytes(row.block));
    EXPECT_EQ(session.getConnected(), row.connectedAfter);
  }
}

TEST(LanIOSessionTest, WireCarriesLineFeedThenCarriageReturnAndBlockHeaders) {
  SimulatedInstrument instrument;
  LanIOSession session("127.0.0.1", instrument.getPort());
  ASSERT_TRUE(session.connect());
  instrument.setRecording(true);
  std::vector<unsigned char> data = bytes(std::string("\0\x01\n\r\xff", 5));
  session.writeLine("FREQ 1e9");
  session.writeBlock("MMEM:DATA 'w',", data);
  session.writeManyBlocksStart("MMEM:DATA 'm',", gsl::span<unsigned char>(data).first(2), 5);
  session.writeManyBlocks(gsl::span<unsigned char>(data).subspan(2));
  session.writeManyBlocksEnd();
  ASSERT_EQ(session.query("*OPC?"), "1"); // everything before has been read
  const std::string body(data.begin(), data.end());
  EXPECT_EQ(instrument.getRecordedBytes(),
            "FREQ 1e9\n\rMMEM:DATA 'w',#15" + body + "\n\rMMEM:DATA 'm',#15" + body + "\n\r*OPC?\n\r");
  EXPECT_EQ(instrument.getBlock("m"), data);
}

TEST(LanIOSessionTest, LargeBlockRoundTripComesBackEqual) {
  SimulatedInstrument instrument;
  LanIOSession session("127.0.0.1", instrument.getPort());
  ASSERT_TRUE(session.connect());
  std::vector<unsigned char> data(64 << 20);
  for (std::size_t i = 0; i < data.size(); ++i)
    data[i] = static_cast<unsigned char>(i * 7 % 251);
  session.writeBlock("MMEM:DATA 'big',", data);
  // Far more than one TCP segment: the body must be collected, not lost.
  EXPECT_TRUE(session.readBlock("MMEM:DATA? 'big'") == data);
}

TEST(LanIOSessionTest, ConnectFailsOnRefusalButNotOnAnUnfinishedHandshake) {
  const auto closed = Platform::listenTcp("127.0.0.1", 0, 1);
  const int closedPort = Platform::localPort(closed);
  Platform::closeSocket(closed);
  EXPECT_FALSE(LanIOSession("127.0.0.1", closedPort).connect());
  EXPECT_FALSE(LanIOSession("", 5025).connect());

  // A listener that never accepts, with its queue filled by a first client,
  // drops further handshakes.
  const auto listener = Platform::listenTcp("127.0.0.1", 0, 0);
  LanIOSession first("127.0.0.1", Platform::localPort(listener));
  ASSERT_TRUE(first.connect());
  LanIOSession stalled("127.0.0.1", Platform::localPort(listener));
  stalled.setTimeoutInMS(500);
  auto start = Clock::now();
  EXPECT_TRUE(stalled.connect()); // under one second: no wait at all
  EXPECT_LT(Clock::now() - start, std::chrono::milliseconds(300));
  LanIOSession waiting("127.0.0.1", Platform::localPort(listener));
  waiting.setTimeoutInMS(1500);
  start = Clock::now();
  EXPECT_TRUE(waiting.connect()); // waits one whole second, then counts as connected
  EXPECT_GE(Clock::now() - start, std::chrono::milliseconds(900));
  Platform::closeSocket(listener);
}

TEST(LanIOSessionTest, WithoutConnectionTransfersThrowOrClearTheFlag) {
  LanIOSession idle("127.0.0.1", 1);
  EXPECT_EQ(thrownMessage<InstrumentException>([&] { idle.writeLine("*RST"); }),
            "Failed to send SCPI *RST to 127.0.0.1");
  const std::string readText = "An I/O error occurred while attempting to read from TCP/IP connection 127.0.0.1";
  EXPECT_EQ(thrownMessage<InstrumentException>([&] { idle.readLine(); }), readText);
  EXPECT_EQ(thrownMessage<InstrumentException>([&] { idle.readBlock("DATA?"); }), readText);
  std::vector<unsigned char> data(16, 1);
  EXPECT_EQ(thrownMessage<InstrumentException>([&] { idle.writeBlock("DATA ", data); }), "Connection error.");
  EXPECT_EQ(thrownMessage<InstrumentException>([&] { idle.writeManyBlocksStart("DATA ", data, 32); }),
            "Connection error.");
  EXPECT_NO_THROW(idle.writeManyBlocks(data));

  // The instrument hangs up at once: sends fail within a few tries and clear
  // the flag instead of throwing.
  SimulatorOptions options;
  options.fault = SimulatorFault::RefuseConnections;
  SimulatedInstrument instrument(options);
  LanIOSession session("127.0.0.1", instrument.getPort());
  ASSERT_TRUE(session.connect());
  for (int i = 0; i < 50 && session.getConnected(); ++i) {
    EXPECT_NO_THROW(session.writeManyBlocks(data));
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  EXPECT_FALSE(session.getConnected());
}

TEST(LanIOSessionTest, SilentInstrumentAnswersEmptyAfterTheTimeoutAndLogs) {
  SimulatorOptions options;
  options.fault = SimulatorFault::Stall;
  SimulatedInstrument instrument(options);
  LanIOSession session("127.0.0.1", instrument.getPort());
  ASSERT_TRUE(session.connect());
  session.setTimeoutInMS(300); // applied to the open socket at once
  LogProbe log;
  const auto start = Clock::now();
  EXPECT_EQ(session.query("*IDN?"), "");
  EXPECT_GE(Clock::now() - start, std::chrono::milliseconds(250));
  ASSERT_EQ(log.texts.size(), 1U);
  EXPECT_EQ(log.texts[0].rfind("WSA error ", 0), 0U);
  EXPECT_TRUE(session.getConnected()); // a time-out does not close
}
