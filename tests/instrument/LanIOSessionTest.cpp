#include "wavemill/instrument/LanIOSession.h"

#include "platform/Socket.h"
#include "support/ExpectThrow.h"
#include "support/TestInstrument.h"
#include "wavemill/services/LogBase.h"

#include <gtest/gtest.h>

#include <chrono>
#include <thread>

using namespace Corvane::Wavemill;
using Testing::thrown;
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

// A simulated instrument and a LAN session connected to it.
class LanIOSessionTest : public ::testing::Test, protected Testing::SimulatedBench {
protected:
  void SetUp() override { ASSERT_TRUE(session.connect()); }
  LanIOSession session{"127.0.0.1", simulator.getPort()};
};

} // namespace

TEST(LanIOSessionReadTest, ReadsKeepFullBuffersAndDropShortPiecesAndBlocksTakeTheAnnouncedBytes) {
  const struct {
    const char *name;
    std::vector<std::string> pieces;
    bool block; // readBlock, else readLine
    std::string answer;
    bool connectedAfter;
  } cases[] = {
      {"CR LF in one piece", {"Corvane,SG200\r\n"}, false, "Corvane,SG200", true},
      {"short piece without end", {"stray", "second\n"}, false, "second", true},
      {"full buffer without end", {std::string(8192, 'a'), "b\n"}, false, std::string(8192, 'a') + "b", true},
      {"two lines in one piece", {"1\n2\n"}, false, "1\n2", true},
      {"zero byte ends", {std::string("ok\0", 3)}, false, "ok", true},
      {"stream ends without line end", {"cut"}, false, "", true},
      {"one digit, five bytes", {"#15ab\ncd\n"}, true, "ab\ncd", true},
      {"body in two pieces", {"#15ab", "cde\n"}, true, "abcde", true},
      {"digit count 0 reads on", {"#0\n"}, true, "", true},
      {"length 0", {"#10\n"}, true, "", true},
      {"short body", {"#3100", "ab"}, true, "", false},
      {"length is no number", {"#2x1abc\n"}, true, "", false},
  };
  for (const auto &row : cases) {
    SCOPED_TRACE(row.name);
    ScriptedServer server(row.pieces);
    LanIOSession session("127.0.0.1", server.port());
    ASSERT_TRUE(session.connect());
    if (row.block) {
      const auto block = session.readBlock("DATA?");
      EXPECT_EQ(std::string(block.begin(), block.end()), row.answer);
      EXPECT_EQ(session.getConnected(), row.connectedAfter);
    } else {
      EXPECT_EQ(session.readLine(), row.answer);
    }
  }
}

// The exact bytes of lines and blocks on the wire are checked through the
// instrument's block writes. Zero bytes do not end the text of queryArray.
TEST_F(LanIOSessionTest, BlocksFarLargerThanOneSegmentAreCollectedWhole) {
  auto big = Testing::pattern(64 << 20);
  session.writeBlock("MMEM:DATA 'big',", big);
  EXPECT_TRUE(session.queryArray("MMEM:DATA? 'big'") == std::string(big.begin(), big.end()));
}

TEST(LanIOSessionConnectTest, ConnectFailsOnRefusalButNotOnAnUnfinishedHandshake) {
  EXPECT_FALSE(LanIOSession("127.0.0.1", 1).connect()); // nothing listens on port 1
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

TEST(LanIOSessionIdleTest, WithoutConnectionTransfersThrow) {
  LanIOSession idle("127.0.0.1", 1);
  const std::string readText =
      "InstrumentException: An I/O error occurred while attempting to read from TCP/IP connection 127.0.0.1";
  std::vector<unsigned char> data(16, 1);
  EXPECT_EQ(thrown([&] { idle.writeLine("*RST"); }), "InstrumentException: Failed to send SCPI *RST to 127.0.0.1");
  EXPECT_EQ(thrown([&] { idle.readLine(); }), readText);
  EXPECT_EQ(thrown([&] { idle.readBlock("DATA?"); }), readText);
  EXPECT_EQ(thrown([&] { idle.writeBlock("DATA ", data); }), "InstrumentException: Connection error.");
  EXPECT_EQ(thrown([&] { idle.writeManyBlocksStart("DATA ", data, 32); }), "InstrumentException: Connection error.");
  EXPECT_EQ(thrown([&] { idle.writeManyBlocks(data); }), "nothing");
}

TEST_F(LanIOSessionTest, SilentInstrumentAnswersEmptyAfterTheTimeoutAndLogs) {
  simulator.setFault(SimulatorFault::Stall);
  session.setTimeoutInMS(300); // applied to the open socket at once
  std::vector<std::string> logged;
  auto subscription = LogBase::get("Log")->getSubject().get_observable().subscribe(
      [&](LogMessage *message) { logged.push_back(message->text); });
  const auto start = Clock::now();
  EXPECT_EQ(session.query("*IDN?"), "");
  EXPECT_GE(Clock::now() - start, std::chrono::milliseconds(250));
  subscription.unsubscribe();
  ASSERT_EQ(logged.size(), 1U);
  EXPECT_EQ(logged[0].rfind("WSA error ", 0), 0U);
  EXPECT_TRUE(session.getConnected()); // a time-out does not close
}
