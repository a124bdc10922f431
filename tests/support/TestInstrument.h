#pragma once

#include "wavemill/instrument/Instrument.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace Corvane::Wavemill::Testing {

/// An instrument as an application derives it: the switches that only a
/// derived class may set are settable, and the options are asked of the
/// device with "*OPT?".
class TestInstrument : public Instrument {
public:
  TestInstrument(std::string address, int timeout) : Instrument(std::move(address)) { timeoutInMS = timeout; }

  void setThrowOnError(bool on) { throwOnError = on; }
  void setDisconnectAfterUse(bool on) { disconnectAfterUse = on; }
  std::string getOptions() override { return query("*OPT?", -1); }
};

/// A simulated instrument on 127.0.0.1, started with `options`, and an
/// instrument on its address that connects on first use.
struct SimulatedBench {
  explicit SimulatedBench(SimulatorOptions options = {}, int timeoutInMS = 2000)
      : simulator(std::move(options)),
        instrument(std::make_shared<TestInstrument>(simulator.getAddress(), timeoutInMS)) {}
  std::string address() const { return simulator.getAddress(); }

  SimulatedInstrument simulator;
  std::shared_ptr<TestInstrument> instrument;
};

/// `size` bytes that hold every value, zero bytes, '\n' and '#' included.
inline std::vector<unsigned char> pattern(std::size_t size) {
  std::vector<unsigned char> bytes(size);
  for (std::size_t i = 0; i < size; ++i)
    bytes[i] = static_cast<unsigned char>(i * 7);
  return bytes;
}

} // namespace Corvane::Wavemill::Testing
