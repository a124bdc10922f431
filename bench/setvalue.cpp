// The cost of one change on the road through the tree: inactive, active
// with a changed and an equal value, nested inside a coupling, and a group
// of ten writes in one SyncTransaction, beside a baseline of one uncontended
// mutex lock/unlock plus one std::function call. Every benchmark reports the
// heap allocations per operation as the counter "allocs".

#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/Couplings.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"

#include "AllocationCounter.h"

#include <benchmark/benchmark.h>

#include <functional>
#include <mutex>

using namespace Corvane::Wavemill;

namespace {

class Generator : public ModelBase {
public:
  Generator() : ModelBase("Bench::Generator") {}
  std::shared_ptr<DoubleSetting> frequency = init(std::make_shared<DoubleSetting>("Frequency"));
  std::shared_ptr<DoubleSetting> period = init(std::make_shared<DoubleSetting>("Period"));
  std::shared_ptr<Int32Setting> count = init(std::make_shared<Int32Setting>("Count"));
  std::shared_ptr<BoolSetting> on = init(std::make_shared<BoolSetting>("On"));
};

struct ActiveTree {
  ActiveTree() : root(std::make_shared<Generator>()), interceptor(root) {
    root->activateSettings(&interceptor, nullptr);
    root->setCouplings(std::make_shared<Couplings>([this](ModelBase *, Transaction *) { ++couples; }));
  }
  std::shared_ptr<Generator> root;
  Interceptor interceptor;
  long long couples = 0;
};

using wavemill_bench::AllocationCount;

void BaselineMutexAndFunction(benchmark::State &state) {
  std::mutex mutex;
  long long calls = 0;
  std::function<void()> function = [&calls] { ++calls; };
  AllocationCount count(state);
  for (auto _ : state) {
    std::lock_guard<std::mutex> guard(mutex);
    function();
  }
  benchmark::DoNotOptimize(calls);
}
BENCHMARK(BaselineMutexAndFunction);

void SetValueInactive(benchmark::State &state) {
  Int32Setting setting("Inactive");
  int value = 0;
  AllocationCount count(state);
  for (auto _ : state)
    setting.setValue(++value);
  benchmark::DoNotOptimize(setting.getValue());
}
BENCHMARK(SetValueInactive);

void SetValueActiveChangedOneSubscriber(benchmark::State &state) {
  ActiveTree tree;
  long long seen = 0;
  auto subscription =
      tree.root->frequency->getSubject().get_observable().subscribe([&seen](const SettingChange &) { ++seen; });
  double value = 0;
  AllocationCount count(state);
  for (auto _ : state)
    tree.root->frequency->setValue(value += 1.0);
  subscription.unsubscribe();
  benchmark::DoNotOptimize(seen);
}
BENCHMARK(SetValueActiveChangedOneSubscriber);

void SetValueActiveEqual(benchmark::State &state) {
  ActiveTree tree;
  tree.root->frequency->setValue(5.0);
  AllocationCount count(state);
  for (auto _ : state)
    tree.root->frequency->setValue(5.0);
  benchmark::DoNotOptimize(tree.couples);
}
BENCHMARK(SetValueActiveEqual);

// Writes made inside a running transaction, as a coupling makes them.
template <class Write> void nestedWrites(benchmark::State &state, Write write) {
  ActiveTree tree;
  auto edit = tree.root->beginEdit(TransactionOption::NoCouple);
  long long i = 0;
  AllocationCount count(state);
  for (auto _ : state)
    write(*tree.root, ++i);
}

void NestedDoubleWrite(benchmark::State &state) {
  nestedWrites(state, [](Generator &g, long long i) { g.period->setValue(static_cast<double>(i)); });
}
BENCHMARK(NestedDoubleWrite);

void NestedInt32Write(benchmark::State &state) {
  nestedWrites(state, [](Generator &g, long long i) { g.count->setValue(static_cast<int>(i)); });
}
BENCHMARK(NestedInt32Write);

void NestedBoolWrite(benchmark::State &state) {
  nestedWrites(state, [](Generator &g, long long i) { g.on->setValue((i & 1) != 0); });
}
BENCHMARK(NestedBoolWrite);

void NestedWriteInsideCoupling(benchmark::State &state) {
  ActiveTree tree;
  tree.root->setCouplings(std::make_shared<Couplings>([](ModelBase *model, Transaction *) {
    auto &g = static_cast<Generator &>(*model);
    g.period->setValue(1.0 / g.frequency->getValue());
  }));
  double value = 1.0;
  AllocationCount count(state);
  for (auto _ : state)
    tree.root->frequency->setValue(value += 1.0);
}
BENCHMARK(NestedWriteInsideCoupling);

void SyncTransactionOfTenWrites(benchmark::State &state) {
  ActiveTree tree;
  double value = 0;
  AllocationCount count(state);
  for (auto _ : state) {
    auto edit = tree.root->beginEdit();
    for (int i = 0; i < 10; ++i)
      tree.root->frequency->setValue(value += 1.0);
  }
  benchmark::DoNotOptimize(tree.couples);
}
BENCHMARK(SyncTransactionOfTenWrites);

} // namespace

BENCHMARK_MAIN();
