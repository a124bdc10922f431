#include "wavemill/json/DisplayDataSerializer.h"
#include "wavemill/json/JsonSerializer.h"

#include "JsonTestModels.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <future>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// Characters that matter to the reader, so that mutations hit its rules.
const std::string alphabet = "{}[]\",:\\ \n\r\t'tfnTF0123456789.-+eE$aAbz\x7f\x01";

std::string mutate(std::string text, std::mt19937 &random) {
  std::uniform_int_distribution<int> edits(1, 8);
  for (int n = edits(random); n > 0; --n) {
    const char c = alphabet[random() % alphabet.size()];
    const std::size_t at = text.empty() ? 0 : random() % (text.size() + 1);
    switch (random() % 3) {
    case 0:
      text.insert(at, 1, c);
      break;
    case 1:
      if (at < text.size())
        text[at] = c;
      break;
    default:
      if (at < text.size())
        text.erase(at, 1 + random() % 16);
    }
  }
  return text;
}

// What is wrong in a live tree: a setting not bound to `interceptor`, a model
// whose owner is not the model that holds it, a hole in a collection.
int faultsIn(const std::shared_ptr<IModel> &model, IModel *owner, Interceptor *interceptor) {
  int faults = model->getOwner() != owner;
  if (auto collection = std::dynamic_pointer_cast<ICollection>(model))
    for (int i = 0; i < collection->getCount(); ++i) {
      auto item = collection->getCommonItem(i);
      faults += item ? faultsIn(item, model.get(), interceptor) : 1;
    }
  if (auto base = std::dynamic_pointer_cast<ModelBase>(model))
    for (const auto &setting : base->getAllSettings()) {
      faults += !setting || setting->getInterceptor() != interceptor;
      if (setting && setting->isSubSetting())
        if (auto held = setting->getCommonValue())
          faults += faultsIn(held, model.get(), interceptor);
    }
  return faults;
}

} // namespace

// Random bytes, truncations, splices and mutations of real documents go
// through every reading entry point. Nothing may crash, hang or read outside
// its text (the sanitizer builds check that); a tree that comes out writes a
// document that reads back with its class.
TEST(JsonFuzzTest, DamagedDocumentsNeverBreakTheReader) {
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Lab", "Corvane.Lab");
  DisplayDataSerializer display;
  const std::vector<std::string> seeds = {serializer.serialize(JsonTests::makeRack()),
                                          serializer.serialize(JsonTests::makeFilter()),
                                          display.serialize(JsonTests::makeRack()->source->getValue())};

  std::mt19937 random(20261122);
  int trees = 0;
  auto existing = JsonTests::makeRack();
  for (int round = 0; round < 30000; ++round) {
    const std::string &seed = seeds[round % seeds.size()];
    std::string text;
    switch (round % 4) {
    case 0:
      text.resize(random() % 256);
      for (auto &c : text)
        c = static_cast<char>(random() % 4 == 0 ? random() : alphabet[random() % alphabet.size()]);
      break;
    case 1:
      text = seed.substr(0, random() % (seed.size() + 1));
      break;
    case 2: {
      const std::string &other = seeds[random() % seeds.size()];
      text = seed.substr(0, random() % (seed.size() + 1)) + other.substr(random() % (other.size() + 1));
      break;
    }
    default:
      text = mutate(seed, random);
    }

    auto object = JsonSerializer::parse(text);
    ASSERT_TRUE(object);
    if (auto tree = serializer.deserialize(text)) {
      ++trees;
      auto again = JsonSerializer::parse(serializer.serialize(tree));
      ASSERT_TRUE(again->hasItem("$type")) << text;
    }
    if (round % 100 == 0)
      existing = JsonTests::makeRack();
    serializer.deserializeToExistObject(object, existing);
    try {
      display.deserializeToExistObject(object, existing->source->getValue());
    } catch (const std::invalid_argument &) {
      // Limits that are no numbers: the display form lets these through.
    } catch (const std::out_of_range &) {
    }
  }
  EXPECT_GT(trees, 1000); // mutations of real documents mostly still read
}

// Damaged documents recalled into a live tree under beginRecall leave it
// live: every model stays bound and owned, the lock is free again, and a
// write from another thread still runs the couplings.
TEST(JsonFuzzTest, DamagedRecallIntoALiveTreeLeavesItUsable) {
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Lab", "Corvane.Lab");
  const std::string seed = serializer.serialize(JsonTests::makeRack());
  Testing::LiveTree<Testing::Rack> tree(JsonTests::makeRack());
  const auto &live = tree.root;
  Interceptor &interceptor = tree.interceptor;
  std::atomic<int> couplings{0};
  live->setCouplings(std::make_shared<Couplings>([&](ModelBase *, Transaction *) { ++couplings; }));

  std::mt19937 random(20261123);
  for (int round = 0; round < 3000; ++round) {
    const std::string text = round % 2 ? mutate(seed, random) : seed.substr(0, random() % (seed.size() + 1));
    {
      auto recall = live->beginRecall();
      try {
        serializer.deserializeToExistObject(JsonSerializer::parse(text), live);
      } catch (const std::invalid_argument &) {
        // Number conversions let the standard exceptions through.
      } catch (const std::out_of_range &) {
      }
    }
    if (round % 100 != 0)
      continue;
    SCOPED_TRACE(text);
    ASSERT_EQ(faultsIn(live, nullptr, &interceptor), 0);
    const int before = couplings.load();
    auto write = std::async(std::launch::async, [&] { live->name->setValue(std::to_string(round % 7)); });
    ASSERT_EQ(write.wait_for(std::chrono::seconds(5)), std::future_status::ready) << "the tree stayed locked";
    EXPECT_GT(couplings.load(), before);
  }
}
