// A guided tour of Wavemill for newcomers. Each section prints what happens
// and in which order, so the output reads as a story of the library at work.

#include "wavemill/wavemill.h"

#include <cstdio>
#include <iostream>
#include <memory>
#include <string>
#include <thread>

// The demo's application classes. They live in a named namespace and are
// registered while the program loads, so the registry lists them under this
// program's name and documents can name them.
namespace Demo {

class Marker : public Corvane::Wavemill::ModelBase {
public:
  WAVEMILL_MODEL(Marker)
  Marker() : Corvane::Wavemill::ModelBase("Demo::Marker") {}
  std::shared_ptr<Corvane::Wavemill::DoubleSetting> position =
      init(std::make_shared<Corvane::Wavemill::DoubleSetting>("Position"));
};

class SignalGenerator : public Corvane::Wavemill::ApplicationBase {
public:
  WAVEMILL_MODEL(SignalGenerator)
  SignalGenerator() : Corvane::Wavemill::ApplicationBase("Demo::SignalGenerator") {}

  std::shared_ptr<Corvane::Wavemill::DoubleSetting> frequency =
      init(std::make_shared<Corvane::Wavemill::DoubleSetting>("Frequency", 1e6, 1.0, 6e9, 0.0));
  std::shared_ptr<Corvane::Wavemill::DoubleSetting> period =
      init(std::make_shared<Corvane::Wavemill::DoubleSetting>("Period", 1e-6, 0.0, 1.0, 0.0));
  std::shared_ptr<Corvane::Wavemill::DoubleSetting> level =
      init(std::make_shared<Corvane::Wavemill::DoubleSetting>("Level", -10.0, -130.0, 20.0, 0.0));
  std::shared_ptr<Corvane::Wavemill::BoolSetting> output =
      init(std::make_shared<Corvane::Wavemill::BoolSetting>("Output"));
  std::shared_ptr<Corvane::Wavemill::SubSetting<Corvane::Wavemill::ModelCollection<Marker>>> markers =
      init(std::make_shared<Corvane::Wavemill::SubSetting<Corvane::Wavemill::ModelCollection<Marker>>>("Markers"));
  std::shared_ptr<Corvane::Wavemill::SubSetting<Corvane::Wavemill::TextMap>> notes =
      init(std::make_shared<Corvane::Wavemill::SubSetting<Corvane::Wavemill::TextMap>>("Notes"));

  void couple(Corvane::Wavemill::Transaction *transaction) override {
    Corvane::Wavemill::ApplicationBase::couple(transaction);
    if (transaction->getSetting() == frequency.get())
      period->setValue(1.0 / frequency->getValue());
  }
};

// A second application: a spectrum analyzer.
class Analyzer : public Corvane::Wavemill::ApplicationBase {
public:
  WAVEMILL_MODEL(Analyzer)
  Analyzer() : Corvane::Wavemill::ApplicationBase("Demo::Analyzer") {}
  std::shared_ptr<Corvane::Wavemill::DoubleSetting> span =
      init(std::make_shared<Corvane::Wavemill::DoubleSetting>("Span", 1e6, 1.0, 1e9, 0.0));
};

} // namespace Demo

WAVEMILL_REGISTER_MODEL(Demo::Marker)
WAVEMILL_REGISTER_MODEL(Demo::SignalGenerator)
WAVEMILL_REGISTER_MODEL(Demo::Analyzer)
// The generator keeps notes in a TextMap; its classes are registered so that
// the notes are saved and recalled with the rest.
WAVEMILL_REGISTER_MODEL(Corvane::Wavemill::TextMap)
WAVEMILL_REGISTER_MODEL(Corvane::Wavemill::TextPair)

using namespace Corvane::Wavemill;
using namespace Demo;

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

// An application: a signal generator whose coupling keeps period and
// frequency consistent, with a list of markers.
void applications() {
  section("Applications, selection and dirtiness");
  auto manager = std::make_shared<ApplicationManager>();
  Interceptor interceptor(manager);
  manager->activateSettings(&interceptor, nullptr);
  auto apps = manager->getApplications();

  auto report = manager->transactions.get_observable().subscribe([apps](Transaction *transaction) {
    std::string method = transaction->getMethodName();
    std::cout << "  finished: " << (method.empty() ? transaction->getSetting()->getName() : method + "()");
    for (const auto &app : apps->getItems())
      std::cout << " | " << app->Name->getValue() << " selected=" << app->Selected->toString()
                << " dirty=" << app->Dirty->toString();
    std::cout << "\n";
  });

  auto generator = std::make_shared<SignalGenerator>();
  generator->Name->setValue("Generator");
  auto analyzer = std::make_shared<Analyzer>();
  analyzer->Name->setValue("Analyzer");

  std::cout << "open the generator (a lone application is selected)\n";
  apps->add(generator);
  std::cout << "open the analyzer\n";
  apps->add(analyzer);
  std::cout << "select the analyzer (selection is exclusive)\n";
  analyzer->Selected->setValue(true);
  std::cout << "set the generator's frequency to 10 MHz (the coupling sets the period)\n";
  generator->frequency->setValue(10e6);
  std::cout << "  -> period " << generator->period->toString()
            << " s, key path of the generator: " << generator->makePath() << "\n";
  std::cout << "add three markers, then remove the first\n";
  auto markers = generator->markers->getValue();
  for (int i = 0; i < 3; ++i) {
    auto marker = markers->addItem();
    marker->position->setValue(0.25 * (i + 1));
  }
  markers->removeAt(0);
  std::cout << "  -> markers at keys";
  for (const auto &marker : markers->getItems())
    std::cout << " " << marker->getThisKey() << "=" << marker->position->toString();
  std::cout << " (path of the last: " << markers->getItem(1)->makePath() << ")\n";
  std::cout << "reset the generator (a reset clears Dirty)\n";
  generator->reset();
  std::cout << "  -> frequency " << generator->frequency->toString() << ", markers kept: " << markers->getCount()
            << "\n";
  std::cout << "keep notes in the generator's text map\n";
  auto notes = generator->notes->getValue();
  notes->setItem("Cable", "N-type, 1 m");
  notes->setItem("Owner", "Lab 3");
  notes->setItem("Cable", "SMA, 0.5 m");
  std::cout << "  -> Cable = " << Tools::q(notes->getItem("Cable")) << ", Owner = " << Tools::q(notes->getItem("Owner"))
            << ", Unknown = " << Tools::q(notes->getItem("Unknown"))
            << ", pairs: " << notes->Items->getValue()->getCount() << "\n";
  report.unsubscribe();
}

void namesAndLibraries() {
  section("Class names out, objects back, and the libraries behind them");
  Activator activator;
  std::cout << "before: SignalGenerator is saved as " << Tools::q(activator.toName(std::make_shared<SignalGenerator>()))
            << "\n";
  std::cout << "updateFullTypeNames(\"WavemillDemo\", \"Corvane.Demo\")\n";
  activator.updateFullTypeNames("WavemillDemo", "Corvane.Demo");
  const std::shared_ptr<IModel> models[] = {
      std::make_shared<SignalGenerator>(), std::make_shared<Analyzer>(),
      std::make_shared<Marker>(),          std::make_shared<ModelCollection<Marker>>(),
      std::make_shared<TextModel>(),       std::make_shared<ApplicationManager>()};
  for (const auto &model : models)
    std::cout << "  " << model->getTypeName() << " is saved as " << Tools::q(activator.toName(model)) << "\n";

  std::cout << "objects back from each accepted form of a name:\n";
  for (const char *name : {"Corvane.Demo.SignalGenerator, WavemillDemo", "Demo.SignalGenerator",
                           "Other.Namespace.SignalGenerator, OtherAssembly", "SignalGenerator",
                           "System.Collections.ObjectModel.Collection`1[[Corvane.Demo.Marker, WavemillDemo]], mscorlib",
                           "Collection`1[[Marker]]", "Corvane.Demo.Oscilloscope, WavemillDemo"}) {
    auto made = activator.toInstance(name);
    std::cout << "  " << Tools::q(name) << " (short " << Tools::q(Activator::makeShortTypeName(name)) << ") -> "
              << (made ? made->getTypeName() : std::string("nothing")) << "\n";
  }

  std::cout << "libraries that contribute model classes:\n";
  LibraryService libraries;
  for (const auto &library : libraries.getLibraries(true)) {
    std::cout << "  #" << library->getIndex() << " " << library->getName() << ":";
    for (const auto &model : library->getModels())
      std::cout << " " << model->getTypeName();
    std::cout << "\n";
  }
}

std::shared_ptr<SignalGenerator> generatorOf(const std::shared_ptr<ApplicationManager> &manager) {
  return std::dynamic_pointer_cast<SignalGenerator>(manager->getApplications()->getItem(0));
}

void printGenerator(const char *when, const std::shared_ptr<ApplicationManager> &manager) {
  auto generator = generatorOf(manager);
  if (!generator) {
    std::cout << "  " << when << ": no generator\n";
    return;
  }
  std::cout << "  " << when << ": frequency " << generator->frequency->toString() << ", level "
            << generator->level->toString() << ", markers " << generator->markers->getValue()->getCount()
            << ", note Cable = " << Tools::q(generator->notes->getValue()->getItem("Cable"))
            << ", dirty=" << generator->Dirty->toString() << "\n";
}

void saveAndRecall() {
  section("Save and recall");
  auto manager = std::make_shared<ApplicationManager>();
  Interceptor interceptor(manager);
  manager->activateSettings(&interceptor, nullptr);
  auto generator = std::make_shared<SignalGenerator>();
  generator->Name->setValue("Generator");
  manager->getApplications()->add(generator);
  manager->getApplications()->add(std::make_shared<Analyzer>());
  generator->frequency->setValue(2.5e9);
  generator->level->setValue(-20.0);
  generator->markers->getValue()->addItem()->position->setValue(0.5);
  generator->notes->getValue()->setItem("Cable", "SMA, 0.5 m");

  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("WavemillDemo", "Corvane.Demo");
  const std::string file =
      Path::combine(Tools::getTempPath(), "wavemill-demo-" + std::to_string(Tools::getCurrentProcessId()) + ".json");
  Tools::writeText(file, serializer.serialize(manager));
  std::cout << "saved the tree to " << file << ":\n" << Tools::readText(file);

  printGenerator("saved", manager);
  std::cout << "change frequency, level, markers and notes\n";
  generator->frequency->setValue(1e6);
  generator->level->setValue(5.0);
  generator->markers->getValue()->addItem();
  generator->notes->getValue()->setItem("Cable", "N-type");
  printGenerator("changed", manager);

  std::cout << "recall the file into the existing tree (deserializeToExistObject under beginRecall)\n";
  {
    auto recall = manager->beginRecall();
    serializer.deserializeToExistObject(JsonSerializer::parse(Tools::readText(file)), manager);
  }
  printGenerator("recalled", manager);
  std::cout << "  the same generator object as before: " << (generatorOf(manager) == generator ? "yes" : "no") << "\n";

  std::cout << "recall the file into a fresh tree (deserialize)\n";
  auto fresh = std::dynamic_pointer_cast<ApplicationManager>(serializer.deserialize(Tools::readText(file)));
  if (fresh) {
    Interceptor freshInterceptor(fresh);
    fresh->activateSettings(&freshInterceptor, nullptr);
    printGenerator("fresh", fresh);
    fresh->deactivateSettings();
  }
  std::remove(file.c_str());

  std::cout << "display data of the analyzer (every stored setting with its limits and flags):\n";
  DisplayDataSerializer display;
  display.getActivator()->updateFullTypeNames("WavemillDemo", "Corvane.Demo");
  std::cout << display.serialize(manager->getApplications()->getItem(1));
}

void tools() {
  section("Tools: configuration files, folders, modules and ping");
  const std::string data = WAVEMILL_EXAMPLE_DATA;
  std::cout << "settings.cfg, key-value lines:\n";
  for (const auto &[key, value] : Tools::readConfig(Path::combine(data, "settings.cfg"), "="))
    std::cout << "  " << key << " = " << Tools::q(value) << "\n";
  std::cout << "instrument.xml, one element per line:\n";
  for (const auto &[key, value] : Tools::readXml(Path::combine(data, "instrument.xml")))
    std::cout << "  " << key << " = " << Tools::q(value) << "\n";
  std::cout << "per-user data folder: " << Path::getDataDirectory("Demo") << "\n";
  std::cout << "module of the library: " << Tools::getLibraryName() << " (" << Tools::getExecutingFileName() << ")\n";
  std::cout << "host " << Tools::getHostname() << ", process " << Tools::getCurrentProcessId() << "\n";
  std::cout << "ping 127.0.0.1: " << (Tools::ping("127.0.0.1", 1000) ? "answered" : "no answer") << "\n";
}

} // namespace

void instruments(); // Instruments.cpp
void waveforms();   // Waveforms.cpp

int main() {
  std::cout << "Wavemill demo\n";
  roadOfAChange();
  applications();
  namesAndLibraries();
  saveAndRecall();
  tools();
  instruments();
  waveforms();
  return 0;
}
