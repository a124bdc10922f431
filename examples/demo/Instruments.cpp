// The instrument section of the tour: a simulated signal generator on a free
// port of 127.0.0.1, an Instrument that talks SCPI to it, the identity and
// options it reports, settings pushed only where they differ, a block sent
// and read back, and a stalled query ending in its time-out.

#include "wavemill/wavemill.h"

#include "wavemill/simulator/SimulatedInstrument.h"

#include <chrono>
#include <cstdlib>
#include <iostream>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// An application's own instrument class: it asks the device for its options
// and lets a caller choose the time-out.
class SignalGeneratorInstrument : public Instrument {
public:
  explicit SignalGeneratorInstrument(const std::string &address) : Instrument(address) {}
  std::string getOptions() override { return query("*OPT?", -1); }
  void setTimeout(int milliseconds) { timeoutInMS = milliseconds; }
};

// Pushes the generator's state; sendIfDifferent asks the instrument first and
// sends only what differs.
int push(SignalGeneratorInstrument &instrument, double frequency, double level, bool output) {
  DoubleSetting frequencyText("Frequency", frequency, 0, 6e9, 0);
  DoubleSetting levelText("Level", level, -130, 20, 0);
  int sent = 0;
  sent += instrument.sendIfDifferent("SOUR1:FREQ " + frequencyText.toString());
  sent += instrument.sendIfDifferent("SOUR1:POW " + levelText.toString());
  sent += instrument.sendIfDifferent(std::string("OUTP ") + (output ? "ON" : "OFF"));
  return sent;
}

// The demo configures Wavemill's own VISA library through its environment,
// as a user would in the shell.
void setEnvironment(const char *name, const std::string &value) {
#ifdef _WIN32
  _putenv_s(name, value.c_str());
#else
  setenv(name, value.c_str(), 1);
#endif
}

// Finds the simulated instrument through the VISA library and asks its
// identity over a VISA address.
void throughVisa(const SimulatedInstrument &simulator) {
  const std::string port = std::to_string(simulator.getPort());
  const std::string resource = "TCPIP0::127.0.0.1::inst0::INSTR";
  setEnvironment("CORVISA_RESOURCES", resource + ";TCPIP0::127.0.0.1::" + port + "::SOCKET;ASRL1::INSTR");
  setEnvironment("CORVISA_INSTR_PORT", port);
  std::cout << "VISA resources matching ?*INSTR:";
  for (const auto &found : VisaIOSession::discover("?*INSTR"))
    std::cout << " " << found;
  std::cout << "\n";
  Instrument overVisa(resource);
  try {
    std::cout << "*IDN? through " << resource << " -> " << overVisa.query("*IDN?", -1) << "\n";
  } catch (const std::exception &error) {
    std::cout << "no VISA library answered: " << error.what() << "\n";
  }
}

} // namespace

void instruments() {
  std::cout << "\n== Talking to an instrument ==\n";
  SimulatedInstrument simulator;
  std::cout << "simulated instrument listening at " << simulator.getAddress() << "\n";

  auto instrument = std::make_shared<SignalGeneratorInstrument>(simulator.getAddress());
  auto resource = instrument->getHardwareResource();
  resource->updateConnection(instrument);
  std::cout << "identity: " << resource->getIdentity() << "\n"
            << "  manufacturer " << resource->getManufacturer() << ", model " << resource->getModelNumber()
            << ", serial " << resource->getSerialNumber() << ", firmware " << resource->getFirmwareRevision() << "\n"
            << "  options " << resource->getOptions() << "\n"
            << "  has B22: " << (resource->has("B22") ? "yes" : "no")
            << "; check for K99: " << Tools::q(resource->checkAll("K99", false)) << "\n";

  std::cout << "push frequency 2.5 GHz, level -20 dBm, output on: " << push(*instrument, 2.5e9, -20, true)
            << " commands sent\n";
  std::cout << "push the same state again: " << push(*instrument, 2.5e9, -20, true) << " commands sent\n";
  std::cout << "instrument reads back SOUR1:FREQ? -> " << instrument->query("SOUR1:FREQ?", -1) << "\n";

  std::vector<unsigned char> waveform(1 << 20);
  for (std::size_t i = 0; i < waveform.size(); ++i)
    waveform[i] = static_cast<unsigned char>(i * 7);
  instrument->sendBlock("MMEM:DATA 'demo.wv',", waveform, 4096);
  auto back = instrument->queryBlock("MMEM:DATA? 'demo.wv'", -1);
  instrument->readLine(1000); // the line feed behind the block
  std::cout << "sent a block of " << waveform.size() << " bytes and read back " << back.size()
            << " bytes: " << (back == waveform ? "equal" : "DIFFERENT") << "\n";

  throughVisa(simulator);

  // A query that meets silence: the LAN session waits for its time-out,
  // reports the socket error on the "Log" channel and answers nothing.
  simulator.setFault(SimulatorFault::Stall);
  instrument->setTimeout(1500);
  auto logged = LogBase::get("Log")->getSubject().get_observable().subscribe(
      [](LogMessage *message) { std::cout << "log: " << message->toString() << "\n"; });
  const auto start = std::chrono::steady_clock::now();
  try {
    const std::string answer = instrument->query("*IDN?", -1);
    std::cout << "stalled query answered " << Tools::q(answer);
  } catch (const std::exception &error) {
    std::cout << "stalled query failed: " << error.what();
  }
  const auto waited = std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - start);
  std::cout << " after " << waited.count() << " ms (time-out 1500 ms)\n";
  logged.unsubscribe();
}
