#include "Commands.h"
#include "Text.h"
#include "ToolError.h"

#include "platform/Signals.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include <iostream>

namespace Corvane::Wavemill::Cli {

int runSim(const SimOptions &options) {
  SimulatorOptions simulator;
  simulator.port = options.port;
  if (!options.identity.empty())
    simulator.identity = options.identity;
  if (!options.options.empty())
    simulator.options = options.options;
  if (!parseSimulatorFault(options.fault, simulator.fault))
    throw UsageError("--fault: unknown mode '" + options.fault +
                     "' (none, stall, close-mid-block, garbage-block, trickle, short-block, no-terminator, refuse)");
  // Before the simulator starts its threads, which inherit the mask.
  if (!Platform::blockTerminationSignals())
    throw ToolError("cannot block SIGINT and SIGTERM");
  try {
    SimulatedInstrument instrument(simulator);
    std::cout << "listening on " << simulator.host << ":" << formatNumber(instrument.getPort()) << "\n"
              << instrument.getAddress() << "\n";
    if (simulator.fault != SimulatorFault::None)
      std::cout << "fault: " << toString(simulator.fault) << "\n";
    std::cout << std::flush;
    std::cerr << "press Ctrl-C to stop\n";
    Platform::waitForTerminationSignal();
    instrument.stop();
    std::cout << "stopped after " << formatNumber(static_cast<std::uint64_t>(instrument.getConnectionCount()))
              << " connections\n";
  } catch (const std::runtime_error &error) {
    // "cannot listen on 127.0.0.1:5025: Address already in use"
    throw ToolError(error.what());
  }
  return 0;
}

} // namespace Corvane::Wavemill::Cli
