// The per-model operations that walk a whole settings list: name lookup
// through the class's map beside a linear search of the list, activation and
// deactivation of a wide model, and copyFrom, duplicate and equals of a model
// with a mix of setting types. Every benchmark reports the heap allocations
// per operation as the counter "allocs".

#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/StringSetting.h"

#include "AllocationCounter.h"

#include <benchmark/benchmark.h>

#include <memory>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

using wavemill_bench::AllocationCount;

// "Setting0000", "Setting0001", ...: short enough to stay in place in a string.
std::string settingName(int i) {
  const std::string digits = std::to_string(i);
  return "Setting" + std::string(digits.size() < 4 ? 4 - digits.size() : 0, '0') + digits;
}

// A model of N settings after "Context", cycling through four value types.
// Each N is its own class, so each has its own name map.
template <int N> class Wide : public ModelBase {
public:
  Wide() : ModelBase("Bench::Wide") {
    for (int i = 0; i < N; ++i) {
      const std::string name = settingName(i);
      switch (i % 4) {
      case 0:
        init(std::make_shared<DoubleSetting>(name.c_str()))->setValue(i * 0.5);
        break;
      case 1:
        init(std::make_shared<Int32Setting>(name.c_str()))->setValue(i);
        break;
      case 2:
        init(std::make_shared<BoolSetting>(name.c_str()))->setValue(i % 3 == 0);
        break;
      default:
        init(std::make_shared<StringSetting>(name.c_str()))->setValue("v" + std::to_string(i));
        break;
      }
    }
  }
  std::shared_ptr<IModel> create() const override { return std::make_shared<Wide>(); }
  std::shared_ptr<IModel> getPrototype() const override { return Prototype::getInstance<Wide>(); }
};

std::shared_ptr<Setting> linearFind(const ModelBase &model, const std::string &name) {
  for (const auto &setting : model.getAllSettings())
    if (setting->getName() == name)
      return setting;
  return nullptr;
}

std::vector<std::string> allNames(const ModelBase &model) {
  std::vector<std::string> names;
  for (const auto &setting : model.getAllSettings())
    names.push_back(setting->getName());
  return names;
}

void GetSettingNearEnd(benchmark::State &state) {
  Wide<200> model;
  const std::string name = settingName(198);
  AllocationCount count(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(model.getSetting(name));
}
BENCHMARK(GetSettingNearEnd);

void LinearSearchNearEnd(benchmark::State &state) {
  Wide<200> model;
  const std::string name = settingName(198);
  AllocationCount count(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(linearFind(model, name));
}
BENCHMARK(LinearSearchNearEnd);

void GetSettingEveryName(benchmark::State &state) {
  Wide<200> model;
  const auto names = allNames(model);
  std::size_t i = 0;
  AllocationCount count(state);
  for (auto _ : state) {
    benchmark::DoNotOptimize(model.getSetting(names[i]));
    i = i + 1 == names.size() ? 0 : i + 1;
  }
}
BENCHMARK(GetSettingEveryName);

void LinearSearchEveryName(benchmark::State &state) {
  Wide<200> model;
  const auto names = allNames(model);
  std::size_t i = 0;
  AllocationCount count(state);
  for (auto _ : state) {
    benchmark::DoNotOptimize(linearFind(model, names[i]));
    i = i + 1 == names.size() ? 0 : i + 1;
  }
}
BENCHMARK(LinearSearchEveryName);

// Deactivation is terminal, so each round binds a fresh model, built and
// taken down outside the timing. "allocs" also counts that building;
// "timedAllocs" counts only the timed call.
void ActivateTenThousandSettings(benchmark::State &state) {
  Interceptor interceptor;
  long long timedAllocs = 0;
  AllocationCount count(state);
  for (auto _ : state) {
    state.PauseTiming();
    auto model = std::make_unique<Wide<10000>>();
    const long long before = wavemill_bench::allocationCounter().load();
    state.ResumeTiming();
    model->activateSettings(&interceptor, nullptr);
    state.PauseTiming();
    timedAllocs += wavemill_bench::allocationCounter().load() - before;
    model.reset();
    state.ResumeTiming();
  }
  state.counters["timedAllocs"] =
      benchmark::Counter(static_cast<double>(timedAllocs), benchmark::Counter::kAvgIterations);
}
BENCHMARK(ActivateTenThousandSettings)->Unit(benchmark::kMicrosecond);

void DeactivateTenThousandSettings(benchmark::State &state) {
  Interceptor interceptor;
  long long timedAllocs = 0;
  AllocationCount count(state);
  for (auto _ : state) {
    state.PauseTiming();
    auto model = std::make_unique<Wide<10000>>();
    model->activateSettings(&interceptor, nullptr);
    const long long before = wavemill_bench::allocationCounter().load();
    state.ResumeTiming();
    model->deactivateSettings();
    state.PauseTiming();
    timedAllocs += wavemill_bench::allocationCounter().load() - before;
    model.reset();
    state.ResumeTiming();
  }
  state.counters["timedAllocs"] =
      benchmark::Counter(static_cast<double>(timedAllocs), benchmark::Counter::kAvgIterations);
}
BENCHMARK(DeactivateTenThousandSettings)->Unit(benchmark::kMicrosecond);

void CopyFromInactive(benchmark::State &state) {
  Wide<1000> source;
  Wide<1000> target;
  const auto shared = std::shared_ptr<IModel>(std::shared_ptr<void>(), &source);
  AllocationCount count(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(target.copyFrom(shared));
}
BENCHMARK(CopyFromInactive)->Unit(benchmark::kMicrosecond);

// An active target copies inside one edit that couples once at its end.
void CopyFromActive(benchmark::State &state) {
  auto source = std::make_shared<Wide<1000>>();
  auto target = std::make_shared<Wide<1000>>();
  Interceptor interceptor(target);
  target->activateSettings(&interceptor, nullptr);
  AllocationCount count(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(target->copyFrom(source));
}
BENCHMARK(CopyFromActive)->Unit(benchmark::kMicrosecond);

void Duplicate(benchmark::State &state) {
  Wide<1000> model;
  AllocationCount count(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(model.duplicate());
}
BENCHMARK(Duplicate)->Unit(benchmark::kMicrosecond);

void EqualsOfEqualModels(benchmark::State &state) {
  Wide<1000> model;
  auto other = std::make_shared<Wide<1000>>();
  AllocationCount count(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(model.equals(other));
}
BENCHMARK(EqualsOfEqualModels)->Unit(benchmark::kMicrosecond);

// A list of 10,000 items in an active tree: appending one item and removing
// the first one (which renumbers every later key) under their transactions.
class BenchItem : public ModelBase {
public:
  WAVEMILL_MODEL(BenchItem)
  BenchItem() : ModelBase("Bench::Item") {}
  std::shared_ptr<DoubleSetting> value = init(std::make_shared<DoubleSetting>("Value"));
};

class BenchList : public ModelBase {
public:
  WAVEMILL_MODEL(BenchList)
  BenchList() : ModelBase("Bench::List") {}
  std::shared_ptr<SubSetting<ModelCollection<BenchItem>>> items =
      init(std::make_shared<SubSetting<ModelCollection<BenchItem>>>("Items"));
};

struct ActiveList {
  explicit ActiveList(int count) : root(std::make_shared<BenchList>()), interceptor(root) {
    root->activateSettings(&interceptor, nullptr);
    root->items->getValue()->resize(count);
  }
  std::shared_ptr<BenchList> root;
  Interceptor interceptor;
};

void AddToTenThousandItems(benchmark::State &state) {
  ActiveList list(10000);
  auto items = list.root->items->getValue();
  wavemill_bench::AllocationCount count(state);
  for (auto _ : state) {
    items->add();
    state.PauseTiming();
    items->removeAt(items->getCount() - 1);
    state.ResumeTiming();
  }
}
BENCHMARK(AddToTenThousandItems)->Unit(benchmark::kMicrosecond);

void RemoveFirstOfTenThousandItems(benchmark::State &state) {
  ActiveList list(10000);
  auto items = list.root->items->getValue();
  wavemill_bench::AllocationCount count(state);
  for (auto _ : state) {
    items->removeAt(0);
    state.PauseTiming();
    items->add();
    state.ResumeTiming();
  }
}
BENCHMARK(RemoveFirstOfTenThousandItems)->Unit(benchmark::kMicrosecond);

} // namespace

BENCHMARK_MAIN();
