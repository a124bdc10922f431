#include "wavemill/json/DisplayDataSerializer.h"
#include "wavemill/json/JsonSerializer.h"

#include "JsonTestModels.h"

#include <gtest/gtest.h>

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

} // namespace

// Random bytes, truncations, splices and mutations of real documents go
// through every reading entry point. Nothing may crash, hang or read outside
// its text (the sanitizer builds check that); a tree that comes out writes a
// document that reads back with its class.
TEST(JsonFuzzTest, DamagedDocumentsNeverBreakTheReader) {
  JsonSerializer serializer;
  serializer.getActivator()->updateFullTypeNames("Lab", "Corvane.Lab");
  DisplayDataSerializer display;
  const std::vector<std::string> seeds = {serializer.serialize(JsonTests::makeBench()),
                                          serializer.serialize(JsonTests::makeFilter()),
                                          display.serialize(JsonTests::makeBench()->filter->getValue())};

  std::mt19937 random(20261122);
  int trees = 0;
  auto existing = JsonTests::makeBench();
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
      existing = JsonTests::makeBench();
    serializer.deserializeToExistObject(object, existing);
    try {
      display.deserializeToExistObject(object, existing->filter->getValue());
    } catch (const std::invalid_argument &) {
      // Limits that are no numbers: the display form lets these through.
    } catch (const std::out_of_range &) {
    }
  }
  EXPECT_GT(trees, 1000); // mutations of real documents mostly still read
}
