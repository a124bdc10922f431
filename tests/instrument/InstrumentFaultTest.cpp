#include "wavemill/instrument/Instrument.h"

#include "support/TestInstrument.h"

#include <gtest/gtest.h>

#include <chrono>
#include <stdexcept>

using namespace Corvane::Wavemill;
using Testing::TestInstrument;

namespace {

constexpr int timeoutInMS = 500;
const std::string identity = SimulatorOptions().identity;

// What one operation on a fresh instrument comes to: "value" (the whole
// answer, or a block that arrived), "tail" (the end of the identity only),
// "empty", or the text of a std::runtime_error.
std::string run(SimulatedInstrument &simulator, const std::string &operation) {
  TestInstrument instrument(simulator.getAddress(), timeoutInMS);
  try {
    if (operation == "query") {
      const std::string answer = instrument.query("*IDN?", -1);
      if (answer.empty() || answer == identity)
        return answer.empty() ? "empty" : "value";
      const bool tail = answer.size() < identity.size() &&
                        identity.compare(identity.size() - answer.size(), answer.size(), answer) == 0;
      return tail ? "tail" : answer;
    }
    std::vector<unsigned char> block(5000, 'x');
    if (operation == "queryBlock") {
      const auto answer = instrument.queryBlock("MMEM:DATA? 'w'", 0);
      return answer.empty() ? "empty" : answer == block ? "value" : "damaged";
    }
    instrument.sendBlock("MMEM:DATA 'v'", block, 4096);
    try {
      instrument.query("*OPC?", -1); // the block has arrived once a later line is read
    } catch (const std::runtime_error &) {
      // A refused connection may fail here or read empty, as the close
      // races the sends; whether the block arrived is what is asked.
    }
    return simulator.getBlock("v") == block ? "value" : "empty";
  } catch (const std::runtime_error &e) {
    return e.what();
  }
}

} // namespace

TEST(InstrumentFaultTest, EveryFaultEndsWithinTheTimeOutWithoutACrash) {
  using F = SimulatorFault;
  const struct {
    SimulatorFault fault;
    const char *query, *queryBlock, *sendBlock;
  } rows[] = {
      // Silence reads as an empty answer once the time-out has passed.
      {F::Stall, "empty", "empty", "value"},
      // A block cut off, replaced or left unfinished is dropped.
      {F::CloseMidBlock, "value", "empty", "value"},
      {F::GarbageBlock, "value", "empty", "value"},
      {F::ShortBlock, "value", "empty", "value"},
      // Pieces that end no line are taken for stray rests, and a trickled
      // block does not arrive within the time-out.
      {F::Trickle, "tail", "empty", "value"},
      // A line without its end is never complete; a block needs none.
      {F::NoTerminator, "empty", "value", "value"},
      // A connection closed at once reads as the end of an empty answer.
      {F::RefuseConnections, "empty", "empty", "empty"},
  };
  for (const auto &row : rows) {
    for (const auto &[operation, expected] : {std::pair{"query", row.query}, std::pair{"queryBlock", row.queryBlock},
                                              std::pair{"sendBlock", row.sendBlock}}) {
      SCOPED_TRACE(toString(row.fault) + " " + operation);
      Testing::SimulatedBench bench({}, timeoutInMS);
      std::vector<unsigned char> block(5000, 'x');
      bench.instrument->sendBlock("MMEM:DATA 'w'", block, 0);
      ASSERT_EQ(bench.instrument->query("*OPC?", -1), "1"); // stored before another connection asks for it
      bench.simulator.setFault(row.fault);

      const auto start = std::chrono::steady_clock::now();
      EXPECT_EQ(run(bench.simulator, operation), expected);
      EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(timeoutInMS + 1000));
    }
  }
}
