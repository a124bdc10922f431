// Proves that the installed simulator library is found as Wavemill::simulator
// and runs: it listens on a port of its own and stops.
#include "wavemill/simulator/SimulatedInstrument.h"

#include <iostream>

int main() {
  Corvane::Wavemill::SimulatedInstrument instrument;
  if (instrument.getPort() <= 0) {
    std::cerr << "wavemill consumer: the simulator has no port\n";
    return 1;
  }
  std::cout << "wavemill consumer: simulator listens at " << instrument.getAddress() << "\n";
  return 0;
}
