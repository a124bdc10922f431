// The JSON model serializer on a tree of about 10,000 models, measured
// against nlohmann::json as a general-purpose reference on the very same
// text. The tree is a scene with a list of 100 channels, each holding plain
// settings and a list of 100 segments: 10,000 segments, 100 channels, 101
// lists and the scene, about 2.3 MB of document.
//
// The targets: Deserialize (text to a new, filled tree) no slower than
// NlohmannParse (text to a nlohmann value), and Serialize (tree to text) no
// slower than NlohmannDump (nlohmann value to text with an indent of 2).
// Every benchmark reports bytes per second over the text it reads or
// writes, the size of that text as "docBytes" and the heap allocations per
// operation as "allocs". The result of a read is freed outside the timing,
// on both sides.

#include "wavemill/json/JsonSerializer.h"
#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/ModelContainer.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/models/SubSetting.h"

#include "AllocationCounter.h"

#include <benchmark/benchmark.h>
#include <nlohmann/json.hpp>

#include <cstdint>
#include <memory>
#include <string>

using namespace Corvane::Wavemill;

namespace JsonBench {

class Segment : public ModelBase {
public:
  WAVEMILL_MODEL(Segment)
  Segment() : ModelBase("JsonBench::Segment") {}
  std::shared_ptr<DoubleSetting> start = init(std::make_shared<DoubleSetting>("Start"));
  std::shared_ptr<Int32Setting> samples = init(std::make_shared<Int32Setting>("Samples"));
  std::shared_ptr<BoolSetting> repeat = init(std::make_shared<BoolSetting>("Repeat"));
  std::shared_ptr<StringSetting> label = init(std::make_shared<StringSetting>("Label"));
};
using Segments = ModelCollection<Segment>;

class Channel : public ModelBase {
public:
  WAVEMILL_MODEL(Channel)
  Channel() : ModelBase("JsonBench::Channel") {}
  std::shared_ptr<StringSetting> name = init(std::make_shared<StringSetting>("Name"));
  std::shared_ptr<DoubleSetting> frequency = init(std::make_shared<DoubleSetting>("Frequency"));
  std::shared_ptr<DoubleSetting> level = init(std::make_shared<DoubleSetting>("Level"));
  std::shared_ptr<Int32Setting> points = init(std::make_shared<Int32Setting>("Points"));
  std::shared_ptr<BoolSetting> enabled = init(std::make_shared<BoolSetting>("Enabled"));
  std::shared_ptr<SubSetting<Segments>> segments = init(std::make_shared<SubSetting<Segments>>("Segments"));
};
using Channels = ModelCollection<Channel>;

class Scene : public ModelBase {
public:
  WAVEMILL_MODEL(Scene)
  Scene() : ModelBase("JsonBench::Scene") {}
  std::shared_ptr<StringSetting> title = init(std::make_shared<StringSetting>("Title"));
  std::shared_ptr<DoubleSetting> sampleRate = init(std::make_shared<DoubleSetting>("SampleRate"));
  std::shared_ptr<SubSetting<Channels>> channels = init(std::make_shared<SubSetting<Channels>>("Channels"));
};

} // namespace JsonBench

WAVEMILL_REGISTER_MODEL(JsonBench::Segment)
WAVEMILL_REGISTER_MODEL(JsonBench::Segments)
WAVEMILL_REGISTER_MODEL(JsonBench::Channel)
WAVEMILL_REGISTER_MODEL(JsonBench::Channels)
WAVEMILL_REGISTER_MODEL(JsonBench::Scene)

namespace {

using JsonBench::Scene;
using wavemill_bench::AllocationCount;

constexpr int channelCount = 100;
constexpr int segmentsPerChannel = 100;

std::shared_ptr<Scene> makeScene() {
  auto scene = std::make_shared<Scene>();
  scene->title->setValue("Multi-carrier scene");
  scene->sampleRate->setValue(245.76e6);
  auto channels = scene->channels->getValue();
  for (int c = 0; c < channelCount; ++c) {
    auto channel = channels->addItem();
    channel->name->setValue("Carrier " + std::to_string(c));
    channel->frequency->setValue(1.0e9 + c * 12.5e6);
    channel->level->setValue(-10.0 - c * 0.25);
    channel->points->setValue(4096 + c);
    channel->enabled->setValue(c % 3 != 0);
    auto segments = channel->segments->getValue();
    for (int s = 0; s < segmentsPerChannel; ++s) {
      auto segment = segments->addItem();
      // A quotient of exact numbers is the double nearest to its decimal,
      // which survives the 15 digits of the text.
      segment->start->setValue((c * 1000 + s * 37) / 1.0e6);
      segment->samples->setValue(1000 + 17 * s);
      segment->repeat->setValue(s % 2 == 0);
      segment->label->setValue("Segment " + std::to_string(c) + "." + std::to_string(s));
    }
  }
  return scene;
}

// A serializer that saves the bench classes as "Corvane.Bench.<Type>, Bench".
// Reading resets the saved names of the reading serializer's Activator, so
// the writing one is never used to read.
std::unique_ptr<JsonSerializer> makeWriter() {
  auto serializer = std::make_unique<JsonSerializer>();
  serializer->getActivator()->updateFullTypeNames("Bench", "Corvane.Bench");
  return serializer;
}

struct Document {
  std::shared_ptr<Scene> scene = makeScene();
  std::string text = makeWriter()->serialize(scene);
};

const Document &document() {
  static const Document shared;
  return shared;
}

void reportBytes(benchmark::State &state, std::size_t bytes) {
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) * static_cast<std::int64_t>(bytes));
  state.counters["docBytes"] = static_cast<double>(bytes);
}

void Serialize(benchmark::State &state) {
  const auto &doc = document();
  auto serializer = makeWriter();
  std::size_t bytes = 0;
  {
    AllocationCount count(state);
    for (auto _ : state) {
      std::string text = serializer->serialize(doc.scene);
      bytes = text.size();
      benchmark::DoNotOptimize(text.data());
    }
  }
  reportBytes(state, bytes);
}
BENCHMARK(Serialize)->Unit(benchmark::kMillisecond);

// Text to a new tree: scanning, creating every model and filling it.
void Deserialize(benchmark::State &state) {
  const auto &doc = document();
  // An application that reads its own documents has named its classes, so
  // every "$type" is found by its exact name.
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Bench", "Corvane.Bench");
  if (auto check = serializer.deserialize(doc.text); !check || !check->equals(doc.scene)) {
    state.SkipWithError("the document does not read back into an equal tree");
    return;
  }
  {
    AllocationCount count(state);
    for (auto _ : state) {
      auto tree = serializer.deserialize(doc.text);
      benchmark::DoNotOptimize(tree.get());
      state.PauseTiming();
      tree.reset();
      state.ResumeTiming();
    }
  }
  reportBytes(state, doc.text.size());
}
BENCHMARK(Deserialize)->Unit(benchmark::kMillisecond);

// Text into an existing tree of the same shape: every model is filled in
// place, none is created. An active tree is filled under a recall
// transaction, the way an application loads a document into its live state:
// every value goes through the tree's lock and notifications.
void fillExistingTree(benchmark::State &state, bool active) {
  const auto &doc = document();
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Bench", "Corvane.Bench");
  auto tree = makeScene();
  Interceptor interceptor(tree);
  if (active)
    tree->activateSettings(&interceptor, nullptr);
  {
    AllocationCount count(state);
    for (auto _ : state) {
      auto object = JsonSerializer::parse(doc.text);
      {
        auto recall = tree->beginRecall(); // the shared empty transaction while inactive
        benchmark::DoNotOptimize(serializer.deserializeToExistObject(object, tree));
      }
      state.PauseTiming();
      object.reset();
      state.ResumeTiming();
    }
  }
  if (!tree->equals(doc.scene))
    state.SkipWithError("the existing tree differs from the document");
  reportBytes(state, doc.text.size());
}

void DeserializeToExistingTree(benchmark::State &state) { fillExistingTree(state, false); }
BENCHMARK(DeserializeToExistingTree)->Unit(benchmark::kMillisecond);

void DeserializeToExistingActiveTree(benchmark::State &state) { fillExistingTree(state, true); }
BENCHMARK(DeserializeToExistingActiveTree)->Unit(benchmark::kMillisecond);

// The token tree alone.
void ParseTokenTree(benchmark::State &state) {
  const auto &doc = document();
  {
    AllocationCount count(state);
    for (auto _ : state) {
      auto object = JsonSerializer::parse(doc.text);
      benchmark::DoNotOptimize(object.get());
      state.PauseTiming();
      object.reset();
      state.ResumeTiming();
    }
  }
  reportBytes(state, doc.text.size());
}
BENCHMARK(ParseTokenTree)->Unit(benchmark::kMillisecond);

// The same tree built by code, with no document: what creating and filling
// the models costs by itself, the floor under Deserialize.
void MakeTreeInCode(benchmark::State &state) {
  AllocationCount count(state);
  for (auto _ : state) {
    auto tree = makeScene();
    benchmark::DoNotOptimize(tree.get());
    state.PauseTiming();
    tree.reset();
    state.ResumeTiming();
  }
}
BENCHMARK(MakeTreeInCode)->Unit(benchmark::kMillisecond);

void NlohmannParse(benchmark::State &state) {
  const auto &doc = document();
  if (!nlohmann::json::accept(doc.text)) {
    state.SkipWithError("the document is no valid JSON");
    return;
  }
  {
    AllocationCount count(state);
    for (auto _ : state) {
      auto value = nlohmann::json::parse(doc.text);
      benchmark::DoNotOptimize(&value);
      state.PauseTiming();
      value = nullptr;
      state.ResumeTiming();
    }
  }
  reportBytes(state, doc.text.size());
}
BENCHMARK(NlohmannParse)->Unit(benchmark::kMillisecond);

// A pretty document like ours: two blanks per level.
void NlohmannDump(benchmark::State &state) {
  const auto &doc = document();
  if (!nlohmann::json::accept(doc.text)) {
    state.SkipWithError("the document is no valid JSON");
    return;
  }
  const auto value = nlohmann::json::parse(doc.text);
  std::size_t bytes = 0;
  {
    AllocationCount count(state);
    for (auto _ : state) {
      std::string text = value.dump(2);
      bytes = text.size();
      benchmark::DoNotOptimize(text.data());
    }
  }
  reportBytes(state, bytes);
}
BENCHMARK(NlohmannDump)->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();
