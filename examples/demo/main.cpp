// A guided tour of Wavemill for newcomers. Each section prints what happens
// and in which order, so the output reads as a story of the library at work.

#include "wavemill/wavemill.h"

#include <cstdio>
#include <iostream>
#include <memory>
#include <string>
#include <thread>

using namespace Corvane::Wavemill;

namespace {

void section(const char *title) { std::cout << "\n== " << title << " ==\n"; }

// A signal generator with a frequency, its period and an output switch.
class Generator : public ModelBase {
public:
  Generator() : ModelBase("Demo::Generator") {}

  std::shared_ptr<DoubleSetting> frequency = init(std::make_shared<DoubleSetting>("Frequency", 1e6, 1.0, 6e9, 0.0));
  std::shared_ptr<DoubleSetting> period = init(std::make_shared<DoubleSetting>("Period", 1e-6, 0.0, 1.0, 0.0));
  std::shared_ptr<BoolSetting> output = init(std::make_shared<BoolSetting>("Output"));
  std::shared_ptr<StringSetting> label = init(std::make_shared<StringSetting>("Label", "CW"));
};

void roadOfAChange() {
  section("The road of one change");
  auto generator = std::make_shared<Generator>();
  Interceptor interceptor(generator);
  generator->activateSettings(&interceptor, nullptr);

  int couplings = 0;
  // The coupling keeps the period consistent with the frequency. Its write is
  // nested: it notifies at once but does not couple again.
  generator->setCouplings(std::make_shared<Couplings>([&couplings](ModelBase *model, Transaction *transaction) {
    auto &g = static_cast<Generator &>(*model);
    ++couplings;
    std::cout << "  coupling #" << couplings << " (started by " << transaction->getSetting()->getName() << ", method '"
              << transaction->getMethodName() << "')\n";
    g.period->setValue(1.0 / g.frequency->getValue());
  }));

  auto onFrequency = generator->frequency->getSubject().get_observable().subscribe([](const SettingChange &change) {
    std::cout << "  setting subscriber: " << change.setting->getName() << " = " << change.setting->toString() << "\n";
  });
  auto onTree = interceptor.getSubject().get_observable().subscribe([](ISetting *setting) {
    std::cout << "  tree subscriber:    " << setting->getName() << " = " << setting->toString() << "\n";
  });
  auto logChannel = LogBase::get("Log");
  auto onLog = logChannel->getSubject().get_observable().subscribe(
      [](LogMessage *message) { std::cout << "  log observer:       " << message->toString() << "\n"; });

  std::cout << "write Frequency = 2 MHz\n";
  generator->frequency->setValue(2e6);
  std::cout << "  -> period is " << generator->period->toString() << " s\n";

  std::cout << "write Frequency = 2 MHz again (equal value: couples, notifies nobody)\n";
  generator->frequency->setValue(2e6);

  std::cout << "write Label while it is read-only (value kept)\n";
  generator->label->setReadOnly(true);
  std::thread([&] { generator->label->setValue("AM"); }).join();
  std::cout << "  -> label is still '" << generator->label->getValue() << "'\n";

  std::cout << "a SyncTransaction groups two writes and couples once, at its end\n";
  {
    auto edit = generator->beginEdit("tune", std::string("tune"), 2);
    generator->frequency->setValue(5e6);
    generator->output->setValue(true);
    std::cout << "  (both writes notified; the coupling waits for the end of the edit)\n";
  }
  Log::writeLogText("Log", 2, "edit finished after " + std::to_string(couplings) + " couplings");

  onFrequency.unsubscribe();
  onTree.unsubscribe();
  onLog.unsubscribe();
}

} // namespace

int main() {
  std::cout << "Wavemill demo\n";
  roadOfAChange();
  return 0;
}
