#pragma once

// The model classes and live trees the tests of every area share: a Source
// with one setting of each common type, a Rack that holds a Source and a
// list of them, a tree that activates a root, and a recorder of the
// notifications a write sends.

#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/Couplings.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Int64Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/models/SubSetting.h"

#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace Corvane::Wavemill::Testing {

/// A signal source: a ranged frequency and level, a switch, a count, a
/// 64-bit offset and a label. Every owner call is written to `events`.
struct Source : ModelBase {
  WAVEMILL_MODEL(Source)
  Source() : ModelBase("Testing::Source") {}
  void onPropertyChanged(ISetting *setting) override { events.push_back("owner:" + setting->getName()); }
  /// Sets the couplings of this model to one function.
  void onCouple(Couplings::Function function) { setCouplings(std::make_shared<Couplings>(std::move(function))); }

  std::vector<std::string> events;
  std::shared_ptr<DoubleSetting> frequency = init(std::make_shared<DoubleSetting>("Frequency", 1e9, 1e3, 40e9, 0.0));
  std::shared_ptr<DoubleSetting> level = init(std::make_shared<DoubleSetting>("Level", -10.0, -130.0, 20.0, 0.0));
  std::shared_ptr<BoolSetting> on = init(std::make_shared<BoolSetting>("On"));
  std::shared_ptr<Int32Setting> count = init(std::make_shared<Int32Setting>("Count", 3, 0, 100, 0));
  std::shared_ptr<Int64Setting> offset = init(std::make_shared<Int64Setting>("Offset"));
  std::shared_ptr<StringSetting> label = init(std::make_shared<StringSetting>("Label", "idle"));
};
using Sources = ModelCollection<Source>;

/// A rack: one Source held by value and a list of Sources.
struct Rack : ModelBase {
  WAVEMILL_MODEL(Rack)
  Rack() : ModelBase("Testing::Rack") {}
  std::shared_ptr<StringSetting> name = init(std::make_shared<StringSetting>("Name"));
  std::shared_ptr<SubSetting<Source>> source = init(std::make_shared<SubSetting<Source>>("Source"));
  std::shared_ptr<SubSetting<Sources>> sources = init(std::make_shared<SubSetting<Sources>>("Sources"));
};

/// A live tree: the root is activated under its own interceptor at once and
/// deactivated when the tree goes.
template <class Root> struct LiveTree {
  LiveTree() { root->activateSettings(&interceptor, nullptr); }
  explicit LiveTree(std::shared_ptr<Root> model) : root(std::move(model)) {
    root->activateSettings(&interceptor, nullptr);
  }
  ~LiveTree() { root->deactivateSettings(); }
  LiveTree(const LiveTree &) = delete;
  LiveTree &operator=(const LiveTree &) = delete;

  std::shared_ptr<Root> root = std::make_shared<Root>();
  Interceptor interceptor{root};
};

/// Collects, in order and from any thread, the notifications of the settings
/// of one model ("setting:<name>") and of a tree ("tree:<name>"). Given a
/// log, it writes into that one, so that they interleave with other entries
/// (such as a Source's owner calls) written on the same thread.
class Notifications {
public:
  Notifications() = default;
  explicit Notifications(std::vector<std::string> &log) : seen(&log) {}
  Notifications(const Notifications &) = delete;
  Notifications &operator=(const Notifications &) = delete;

  /// Records the changes of every setting `model` has now.
  void watch(ModelBase &model) {
    for (const auto &setting : model.getAllSettings())
      subscriptions.push_back(setting->getSubject().get_observable().subscribe(
          [this](const SettingChange &change) { add("setting:" + change.setting->getName()); }));
  }
  /// Records the tree's notifications.
  void watch(Interceptor &tree) {
    subscriptions.push_back(
        tree.getSubject().get_observable().subscribe([this](ISetting *setting) { add("tree:" + setting->getName()); }));
  }
  /// What was recorded so far, and forgets it.
  std::vector<std::string> take() {
    std::lock_guard<std::mutex> lock(mutex);
    return std::exchange(*seen, {});
  }
  ~Notifications() {
    for (auto &subscription : subscriptions)
      subscription.unsubscribe();
  }

private:
  void add(std::string text) {
    std::lock_guard<std::mutex> lock(mutex);
    seen->push_back(std::move(text));
  }
  std::mutex mutex;
  std::vector<std::string> own;
  std::vector<std::string> *seen = &own;
  std::vector<rx::subscription> subscriptions;
};

} // namespace Corvane::Wavemill::Testing
