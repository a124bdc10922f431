#include "support/TestModels.h"
#include "wavemill/json/JsonSerializer.h"
#include "wavemill/models/TextMap.h"

#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

using namespace Corvane::Wavemill;

// Writers add and overwrite keys while readers look them up; every value a
// reader sees must be one a writer stored, and the map ends with one pair
// per key.
TEST(TextMapConcurrencyTest, ReadersAndWritersShareTheMap) {
  Testing::LiveTree<TextMap> tree;
  auto &map = tree.root;

  constexpr int keys = 40;
  constexpr int rounds = 20;
  std::atomic<int> foreign{0};
  std::vector<std::thread> threads;
  for (int writer = 0; writer < 2; ++writer)
    threads.emplace_back([&map, writer] {
      for (int round = 0; round < rounds; ++round)
        for (int key = 0; key < keys; ++key)
          map->setItem("k" + std::to_string(key), "v" + std::to_string(writer));
    });
  for (int reader = 0; reader < 2; ++reader)
    threads.emplace_back([&map, &foreign] {
      for (int round = 0; round < rounds; ++round)
        for (int key = 0; key < keys; ++key) {
          auto value = map->getItem("k" + std::to_string(key));
          if (!value.empty() && value != "v0" && value != "v1")
            ++foreign;
        }
    });
  for (auto &thread : threads)
    thread.join();

  EXPECT_EQ(foreign.load(), 0);
  EXPECT_EQ(map->Items->getValue()->getCount(), keys);
  for (int key = 0; key < keys; ++key) {
    auto value = map->getItem("k" + std::to_string(key));
    EXPECT_TRUE(value == "v0" || value == "v1") << value;
  }
}

// A recall into the live map rebuilds the index while readers look keys up:
// a reader never misses a key that is in the map before and after.
TEST(TextMapConcurrencyTest, RecallRebuildsTheIndexWhileReadersLookUp) {
  Testing::LiveTree<TextMap> tree;
  auto &map = tree.root;
  constexpr int keys = 30;
  for (int key = 0; key < keys; ++key)
    map->setItem("k" + std::to_string(key), "v" + std::to_string(key));
  JsonSerializer serializer;
  serializer.getActivator()->registerType<TextMap>("");
  const auto document = JsonSerializer::parse(serializer.serialize(map));

  std::atomic<bool> recalling{true};
  std::atomic<int> missed{0};
  std::thread reader([&] {
    while (recalling.load())
      for (int key = 0; key < keys; ++key)
        if (map->getItem("k" + std::to_string(key)) != "v" + std::to_string(key))
          ++missed;
  });
  for (int round = 0; round < 200; ++round) {
    auto recall = map->beginRecall();
    serializer.deserializeToExistObject(document, map);
  }
  recalling = false;
  reader.join();

  EXPECT_EQ(missed.load(), 0);
  EXPECT_EQ(map->getItem("k7"), "v7");
}
