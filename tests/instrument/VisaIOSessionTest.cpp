// Runs with WAVEMILL_VISA_LIBRARY naming corvisa, our VISA library over raw
// TCP, whose call recorder shows each VISA call the session makes.
#include "wavemill/instrument/VisaIOSession.h"

#include "CorVisa.h"
#include "instrument/VisaStatusText.h"
#include "platform/Environment.h"
#include "support/ExpectThrow.h"
#include "support/TestInstrument.h"

#include <gtest/gtest.h>

#include <chrono>
#include <functional>
#include <thread>

using namespace Corvane::Wavemill;
using Testing::pattern;
using Testing::VisaCalls;
using Strings = std::vector<std::string>;

namespace {

const std::string endOff = "viSetAttribute 0x3FFF0016 0";
const std::string endOn = "viSetAttribute 0x3FFF0016 1";

// What the simulator has received once `size` bytes are in, or after 2 s.
std::string receivedBytes(const SimulatedInstrument &simulator, std::size_t size) {
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(2);
  std::string bytes = simulator.getRecordedBytes();
  for (; bytes.size() < size && std::chrono::steady_clock::now() < deadline; bytes = simulator.getRecordedBytes())
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  return bytes;
}

std::string text(const std::vector<unsigned char> &bytes) { return {bytes.begin(), bytes.end()}; }

// A VISA session over a socket to a simulated instrument.
class VisaIOSessionTest : public ::testing::Test, protected Testing::SimulatedBench {
protected:
  void SetUp() override { ASSERT_TRUE(session.connect()); }
  VisaIOSession session{address()};
};

} // namespace

// The VISA session's answers end in "\n", which the instrument takes off.
TEST_F(VisaIOSessionTest, InstrumentWorksOnAVisaSessionAsOnLan) {
  VisaCalls calls;
  auto visaInstrument = std::make_shared<Testing::TestInstrument>(address(), 5000);
  visaInstrument->setIOSession(std::make_shared<VisaIOSession>(address()));
  visaInstrument->send("FREQ 2E9");
  EXPECT_EQ(visaInstrument->query("FREQ?", -1), "2E9");
  EXPECT_EQ(calls.stop().at(1), "viOpen " + address());
}

TEST_F(VisaIOSessionTest, BlockWritesGoInPiecesWithEndBeforeTheLastOne) {
  auto five = pattern(5);
  auto whole = pattern(2048);
  const struct {
    const char *name;
    std::function<void()> write;
    Strings calls;
    std::string wire;
  } rows[] = {
      {"whole pieces",
       [&] { session.writeManyBlocks(whole); },
       {endOff, "viWrite 1024", endOff, "viWrite 1024"},
       text(pattern(2048))},
      {"nothing", [&] { session.writeManyBlocks({}); }, {endOff}, ""},
      {"end", [&] { session.writeManyBlocksEnd(); }, {endOff, endOn, "viWrite 1"}, std::string(1, '\0')},
      {"block",
       [&] { session.writeBlock("MMEM:DATA 'a',", five); },
       {endOff, endOff, "viWrite 16", endOff, endOff, "viWrite 5", endOff, endOn, "viWrite 1"},
       "MMEM:DATA 'a',#1" + text(five) + std::string(1, '\0')},
      {"many blocks",
       [&] { session.writeManyBlocksStart("MMEM:DATA 'a',", five, 1234567); },
       {endOff, endOff, "viWrite 23", endOff, endOff, "viWrite 5"},
       "MMEM:DATA 'a',#71234567" + text(five)},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    simulator.setRecording(false);
    simulator.setRecording(true);
    VisaCalls calls;
    row.write();
    EXPECT_EQ(calls.stop(), row.calls);
    EXPECT_EQ(receivedBytes(simulator, row.wire.size()), row.wire);
  }
}

TEST_F(VisaIOSessionTest, WriteRaisesTheTimeOutForLongTextsOnlyAndRestoresIt) {
  const std::string before = "viGetAttribute 0x3FFF0016", timeout = "viGetAttribute 0x3FFF001A";
  const struct {
    std::size_t length;
    Strings calls;
  } rows[] = {
      {299998, {before, endOn, timeout, "viWrite 299999", endOn}},
      {300000,
       {before, endOn, timeout, "viSetAttribute 0x3FFF001A 10000", "viWrite 300001", "viSetAttribute 0x3FFF001A 6000",
        endOn}},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.length);
    VisaCalls calls;
    session.writeLine(std::string(row.length, 'A'));
    EXPECT_EQ(calls.stop(), row.calls);
    EXPECT_EQ(session.getTimeoutInMS(), 6000);
  }
}

// The answer's header "#<digits><length>" is read a byte at a time; a digit
// count or a length digit that is no digit ends the block, and the rest of
// the answer is cleared away.
TEST_F(VisaIOSessionTest, ReadBlockReadsHeaderBodyAndTerminatorAndClearsAfterAText) {
  session.writeLine("FREQ 5");
  auto block = pattern(12);
  session.writeManyBlocksStart("MMEM:DATA 'b',", block, 12);
  ASSERT_EQ(session.query("*OPC?"), "1\n");
  const auto reads = [&](int count, Strings tail) {
    Strings all(static_cast<std::size_t>(count), "viRead 1");
    all.insert(all.end(), tail.begin(), tail.end());
    return all;
  };
  const struct {
    const char *command;
    const char *identity; // the answer to *IDN?
    std::string block;
    Strings reads;
  } rows[] = {
      {"MMEM:DATA? 'b'", "", text(pattern(12)), reads(4, {"viRead 12", "viRead 1"})},
      {"FREQ?", "", "", reads(1, {"viClear"})}, // the rest of the text is thrown away
      {"*IDN?", "#9000000005abcde", "abcde", reads(11, {"viRead 5", "viRead 1"})},
      {"*IDN?", "#209abcdefghi", "abcdefghi", reads(4, {"viRead 9", "viRead 1"})},
      {"*IDN?", "#0", "", reads(3, {})},
      {"*IDN?", "#/1a", "", reads(2, {"viClear"})},
      {"*IDN?", "#:1a", "", reads(2, {"viClear"})},
      {"*IDN?", "#2/1a", "", reads(3, {"viClear"})},
      {"*IDN?", "#21:a", "", reads(4, {"viClear"})},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(std::string(row.command) + " " + row.identity);
    simulator.setIdentity(row.identity);
    VisaCalls calls;
    EXPECT_EQ(text(session.readBlock(row.command)), row.block);
    const auto written = "viWrite " + std::to_string(std::string(row.command).size() + 1);
    // END was off after the block start and is put back so.
    Strings expected = {"viGetAttribute 0x3FFF0016", endOn, "viGetAttribute 0x3FFF001A", written, endOff};
    expected.insert(expected.end(), row.reads.begin(), row.reads.end());
    EXPECT_EQ(calls.stop(), expected);
  }
}

TEST_F(VisaIOSessionTest, VisaFailuresThrowTheDescriptionWithOnlyPlainBytes) {
  char description[256] = {};
  ASSERT_EQ(Testing::visa().viStatusDesc(0, 0x12345, description), 0);
  EXPECT_EQ(visaStatusText(description, sizeof description), "Unknown status      code ");

  simulator.setFault(SimulatorFault::Stall);
  session.setTimeoutInMS(100);
  session.writeLine("*IDN?");
  EXPECT_EQ(Testing::thrown([&] { session.readLine(); }),
            "ApplicationException: VI_ERROR_TMO: Timeout expired before operation completed. ");
  EXPECT_TRUE(session.getConnected()); // a failed transfer leaves the session open
  EXPECT_FALSE(VisaIOSession("TCPIP0::127.0.0.1::1::SOCKET").connect());
}

TEST_F(VisaIOSessionTest, DiscoverListsTheConfiguredResourcesThatMatchAndClosesItsHandles) {
  ASSERT_TRUE(Platform::setEnvironmentVariable("CORVISA_RESOURCES",
                                               "TCPIP0::10.0.0.1::inst0::INSTR;GPIB0::7::INSTR;"
                                               "TCPIP0::10.0.0.2::5025::SOCKET;usb0::1::2::INSTR"));
  const struct {
    const char *expression;
    Strings found;
    Strings calls;
  } rows[] = {
      {"?*INSTR",
       {"TCPIP0::10.0.0.1::inst0::INSTR", "GPIB0::7::INSTR", "usb0::1::2::INSTR"},
       {"viOpenDefaultRM", "viFindRsrc ?*INSTR", "viFindNext", "viFindNext", "viClose", "viClose"}},
      {"tcpip?*::socket",
       {"TCPIP0::10.0.0.2::5025::SOCKET"},
       {"viOpenDefaultRM", "viFindRsrc tcpip?*::socket", "viClose", "viClose"}},
      {"ASRL?*", {}, {"viOpenDefaultRM", "viFindRsrc ASRL?*", "viClose"}},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.expression);
    VisaCalls calls;
    EXPECT_EQ(VisaIOSession::discover(row.expression), row.found);
    EXPECT_EQ(calls.stop(), row.calls);
  }
}
