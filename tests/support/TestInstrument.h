#pragma once

#include "wavemill/instrument/Instrument.h"

#include <string>
#include <utility>

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

} // namespace Corvane::Wavemill::Testing
