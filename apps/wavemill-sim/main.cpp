// wavemill-sim: a simulated SCPI instrument on 127.0.0.1 that runs in the
// foreground until Ctrl-C or SIGTERM, for clients without hardware.
//
//   wavemill-sim [--port N] [--idn TEXT] [--options TEXT] [--fault MODE]
#include "platform/Signals.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include <charconv>
#include <exception>
#include <iostream>
#include <string>
#include <string_view>

using namespace Corvane::Wavemill;

namespace {

constexpr const char *usage = "usage: wavemill-sim [--port N] [--idn TEXT] [--options TEXT] [--fault MODE]\n"
                              "  --port N        TCP port on 127.0.0.1, 0 picks a free one (default 5025)\n"
                              "  --idn TEXT      answer to *IDN?\n"
                              "  --options TEXT  answer to *OPT?\n"
                              "  --fault MODE    none, stall, close-mid-block, garbage-block, trickle,\n"
                              "                  short-block, no-terminator, refuse\n";

template <class Integer> std::string decimal(Integer value) {
  char text[24];
  const auto written = std::to_chars(text, text + sizeof text, value);
  return std::string(text, written.ptr);
}

bool parsePort(std::string_view text, int &port) {
  int value = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
  if (error != std::errc() || end != text.data() + text.size() || value < 0 || value > 65535)
    return false;
  port = value;
  return true;
}

// Fills `options` from the command line; false with a message on standard
// error for anything it does not understand.
bool parseArguments(int argc, char **argv, SimulatorOptions &options, bool &help) {
  options.port = 5025;
  for (int i = 1; i < argc; ++i) {
    const std::string_view name = argv[i];
    if (name == "--help" || name == "-h") {
      help = true;
      return true;
    }
    if (i + 1 >= argc) {
      std::cerr << "wavemill-sim: " << name << (name.rfind("--", 0) == 0 ? " needs a value\n" : ": unknown argument\n");
      return false;
    }
    const std::string value = argv[++i];
    if (name == "--port") {
      if (!parsePort(value, options.port)) {
        std::cerr << "wavemill-sim: --port: not a port number: " << value << "\n";
        return false;
      }
    } else if (name == "--idn") {
      options.identity = value;
    } else if (name == "--options") {
      options.options = value;
    } else if (name == "--fault") {
      if (!parseSimulatorFault(value, options.fault)) {
        std::cerr << "wavemill-sim: --fault: unknown mode: " << value << "\n";
        return false;
      }
    } else {
      std::cerr << "wavemill-sim: " << name << ": unknown argument\n";
      return false;
    }
  }
  return true;
}

} // namespace

int main(int argc, char **argv) {
  SimulatorOptions options;
  bool help = false;
  if (!parseArguments(argc, argv, options, help)) {
    std::cerr << usage;
    return 2;
  }
  if (help) {
    std::cout << usage;
    return 0;
  }
  // Before the simulator starts its threads, which inherit the mask.
  if (!Platform::blockTerminationSignals()) {
    std::cerr << "wavemill-sim: cannot block SIGINT and SIGTERM\n";
    return 1;
  }
  try {
    SimulatedInstrument instrument(options);
    std::cout << "listening on " << options.host << ":" << decimal(instrument.getPort()) << "\n"
              << instrument.getAddress() << "\n";
    if (options.fault != SimulatorFault::None)
      std::cout << "fault: " << toString(options.fault) << "\n";
    std::cout << std::flush;
    Platform::waitForTerminationSignal();
    instrument.stop();
    std::cout << "stopped after " << decimal(instrument.getConnectionCount()) << " connections\n";
  } catch (const std::exception &error) {
    std::cerr << "wavemill-sim: " << error.what() << "\n";
    return 1;
  }
  return 0;
}
