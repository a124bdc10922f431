#include "wavemill/instrument/Instrument.h"

#include "support/ExpectThrow.h"
#include "support/TestInstrument.h"
#include "wavemill/models/DoubleSetting.h"

#include <gtest/gtest.h>

#include <chrono>
#include <clocale>
#include <functional>
#include <limits>
#include <memory>

using namespace Corvane::Wavemill;
using Testing::pattern;
using Testing::TestInstrument;
using Testing::thrown;
using Strings = std::vector<std::string>;

namespace {

class InstrumentTest : public ::testing::Test, protected Testing::SimulatedBench {};

} // namespace

TEST_F(InstrumentTest, SendWritesOneLineAndReadsTheAnswerOfAQueryOnly) {
  const std::string previous = std::setlocale(LC_ALL, nullptr);
  std::setlocale(LC_ALL, "de_DE.utf8"); // printf writes 1,5 here, where the locale is installed
  const struct {
    std::function<void()> send;
    const char *onWire;
  } rows[] = {
      {[&] { instrument->send("*IDN?"); }, "*IDN?"},
      {[&] { instrument->send("MMEM:NAME 'a[1]'"); }, "MMEM:NAME 'a[1]'"},
      {[&] { instrument->send("[SOUR1:]LIST:NAME 'x[2]'"); }, "SOUR1:LIST:NAME 'x[2]'"},
      {[&] { instrument->sendNumber("FREQ ", 1.5); }, "FREQ 1.500000"},
      {[&] { instrument->sendNumber("FREQ", -4e-7); }, "FREQ -0.000000"},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.onWire);
    simulator.clearCommands();
    const auto start = std::chrono::steady_clock::now();
    row.send();
    // A read after a command would wait for the whole time-out.
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(1000));
    // An answer left in the input would be read here instead of "1".
    EXPECT_EQ(instrument->query("*OPC?", -1), "1");
    EXPECT_EQ(simulator.getCommands(), (Strings{row.onWire, "*OPC?"}));
  }
  std::setlocale(LC_ALL, previous.c_str());
}

TEST_F(InstrumentTest, ArgumentFaultsThrowTheirTextAndSendNothing) {
  TestInstrument idle("", 2000);
  idle.setThrowOnError(false);
  std::vector<unsigned char> data(4);
  auto &i = *instrument;
  EXPECT_EQ(thrown([&] { i.send(""); }), "invalid_argument: command");
  EXPECT_EQ(thrown([&] { i.query("", -1); }), "invalid_argument: command");
  EXPECT_EQ(thrown([&] { i.query("*IDN?", -2); }), "invalid_argument: timeoutInMS");
  EXPECT_EQ(thrown([&] { i.queryBlock("", 0); }), "invalid_argument: command");
  EXPECT_EQ(thrown([&] { i.queryBlock("X?", -2); }), "ArgumentOutOfRangeException: timeoutInMS");
  EXPECT_EQ(thrown([&] { i.queryArray(""); }), "invalid_argument: query");
  EXPECT_EQ(thrown([&] { i.sendBlock("", data, 0); }), "invalid_argument: command");
  EXPECT_EQ(thrown([&] { i.sendIfDifferent("FREQ"); }), "invalid_argument: command");
  EXPECT_EQ(thrown([&] { i.sendIfDifferent("FREQ 1 2"); }), "invalid_argument: command");
  EXPECT_EQ(thrown([&] { idle.query("*IDN?", -1); }), "runtime_error: The instrument address is empty.");
  EXPECT_TRUE(simulator.getCommands().empty());
  // 0 is a valid time-out for query: the connection opens with the default.
  EXPECT_EQ(instrument->query("*IDN?", 0), SimulatorOptions().identity);
}

// An empty answer, which leaves nothing to compare with, is in the failure test.
TEST_F(InstrumentTest, SendIfDifferentComparesNumbersByValueAndTextsByShortForm) {
  const struct {
    const char *present;
    const char *command;
    bool sent;
  } rows[] = {
      {"FREQ +1.00000000E+009", "FREQ 1E9", false}, {"FREQ +1.00000000E+009", "FREQ 2E9", true},
      {"UNIT VOLT", "UNIT VOLTAGE", false},         {"UNIT VOLT", "UNIT voltage", true},
      {"UNIT VOLTAGE", "UNIT VOLT", true},          {"FREQ 1E9", "FREQ -", false},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.command);
    instrument->send(row.present);
    instrument->query("*OPC?", -1); // the simulator has taken the value in
    simulator.clearCommands();
    const std::string command = row.command;
    EXPECT_EQ(instrument->sendIfDifferent(command), row.sent);
    // A command gets no answer: *OPC? makes sure the simulator has read it.
    instrument->query("*OPC?", -1);
    const std::string query = command.substr(0, command.find(' ')) + "?";
    EXPECT_EQ(simulator.getCommands(), row.sent ? (Strings{query, command, "*OPC?"}) : (Strings{query, "*OPC?"}));
    EXPECT_FALSE(instrument->sendIfDifferent(command)); // the second push finds the value in place
  }
}

TEST_F(InstrumentTest, SendBlockPutsTheSameBytesOnTheWireWhateverTheThreshold) {
  const struct {
    const char *command;
    std::size_t size;
    int maxBlockSize;
    const char *header;
  } rows[] = {
      {"MMEM:DATA 'w'", 5000, 4096, "MMEM:DATA 'w',#45000"}, // in parts, with a rest
      {"MMEM:DATA 'w'", 8192, 4096, "MMEM:DATA 'w',#48192"}, // in whole parts
      {" MMEM:DATA 'w' ", 5, 0, "MMEM:DATA 'w',#15"},        {" MMEM:DATA 'w', ", 5, 0, " MMEM:DATA 'w', #15"},
      {" SOUR:WAV:DATA ", 5, 0, "SOUR:WAV:DATA #15"},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(std::string(row.header) + " " + std::to_string(row.maxBlockSize));
    auto data = pattern(row.size);
    simulator.setRecording(false);
    simulator.setRecording(true);
    instrument->sendBlock(row.command, data, row.maxBlockSize);
    EXPECT_EQ(instrument->query("*OPC?", -1), "1");
    // The last "\r" may still be on its way when the answer is in.
    const std::string expected = row.header + std::string(data.begin(), data.end()) + "\n\r*OPC?\n";
    EXPECT_EQ(simulator.getRecordedBytes().substr(0, expected.size()), expected);
  }
  EXPECT_EQ(simulator.getBlock("SOUR:WAV:DATA"), pattern(5));
}

TEST_F(InstrumentTest, FailuresThrowTheirTextOrEndEmptyByThrowOnError) {
  EXPECT_EQ(instrument->query("*OPC?", -1), "1");
  simulator.stop(); // the open connection is gone, and the port refuses from now on

  // The peer's reset shows as a failed send, and the session's own text is
  // lost in the message.
  instrument->setThrowOnError(false);
  EXPECT_EQ(instrument->query("*OPC?", -1), "");
  instrument->setThrowOnError(true);
  EXPECT_EQ(thrown([&] { instrument->query("*IDN?", -1); }), "runtime_error: Application Exception(*IDN?)");

  TestInstrument fresh(address(), 1000);
  EXPECT_EQ(thrown([&] { fresh.query("*IDN?", -1); }), "runtime_error: Failed to send SCPI *IDN? to " + address());
  fresh.setThrowOnError(false);
  std::vector<unsigned char> data(5000);
  EXPECT_EQ(fresh.query("*IDN?", -1), "");
  EXPECT_EQ(fresh.queryNumber("FREQ?"), 0.0);
  EXPECT_EQ(fresh.queryArray("MMEM:DATA? 'w'"), "");
  EXPECT_TRUE(fresh.queryBlock("MMEM:DATA? 'w'", 0).empty());
  EXPECT_EQ(thrown([&] { fresh.send("FREQ 1"), fresh.sendBlock("MMEM:DATA 'w'", data, 0); }), "nothing");
  // Without an answer there is nothing to compare with.
  EXPECT_EQ(thrown([&] { fresh.sendIfDifferent("FREQ 1"); }), "invalid_argument: The SCPI command is incorrrect.");
}

TEST_F(InstrumentTest, ConnectsOnFirstUseAndPerOperationWhenAsked) {
  EXPECT_EQ(simulator.getConnectionCount(), 0U);
  instrument->query("*OPC?", -1);
  instrument->query("*OPC?", -1);
  EXPECT_EQ(simulator.getConnectionCount(), 1U);
  instrument->setDisconnectAfterUse(true);
  for (int i = 0; i < 3; ++i)
    EXPECT_EQ(instrument->query("*IDN?", -1), SimulatorOptions().identity);
  EXPECT_EQ(simulator.getConnectionCount(), 3U); // the open one is used once more, then one per query
}

TEST_F(InstrumentTest, ClipUsesTheRangeKeptByNameOrTheInstrumentLimits) {
  auto &ranges = instrument->getHardwareResource()->getRanges();
  ranges["Stepped"] = {0.0, 100.0, 10.0};
  const double tiny = std::numeric_limits<double>::min();
  auto &i = *instrument;
  const struct {
    const char *name;
    double value;
    std::function<void(const std::shared_ptr<DoubleSetting> &)> clip;
    double expected;
  } rows[] = {
      {"Frequency", 1e10, [&](auto &s) { i.queryAndClip(s, instrument, "FREQ"); }, 6e9},
      {"Default", -5.0, [&](auto &s) { i.clip(s); }, tiny}, // a new range starts above zero
      {"Limited", 20.0, [&](auto &s) { i.setAndClip(s, 0.0, 10.0); }, 10.0},
      {"Stepped", 37.0, [&](auto &s) { i.clip(s); }, 40.0},
      {"Stepped", 37.0, [&](auto &s) { i.clip(s, 25.0); }, 25.0},
      {"Stepped", 37.0, [&](auto &s) { i.setAndClip(s, 0.0, 30.0, 4.0); }, 30.0},
  };
  for (const auto &row : rows) {
    SCOPED_TRACE(row.name);
    auto setting = std::make_shared<DoubleSetting>(row.name);
    setting->setValue(row.value);
    row.clip(setting);
    EXPECT_EQ(setting->getValue(), row.expected);
    EXPECT_EQ(ranges.count(row.name), 1U);
  }
  // Limits given or asked for are used once and not kept.
  EXPECT_EQ(ranges["Limited"].max, std::numeric_limits<double>::max());
  EXPECT_EQ(ranges["Frequency"].min, tiny);
  EXPECT_EQ(ranges["Stepped"].max, 100.0);
}
