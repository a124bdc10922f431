#include "wavemill/tools/Tools.h"

#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <map>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

// Shared by every fuzz case in this file. The seed is fixed so that a failure
// repeats on every machine; the sanitizers of the asan preset are the oracle.
constexpr std::mt19937::result_type fuzzSeed = 20240611;
constexpr int fuzzRounds = 4000;

/// Up to `maxLength` arbitrary bytes, zero bytes included.
std::string randomBytes(std::mt19937 &random, std::size_t maxLength) {
  std::uniform_int_distribution<std::size_t> length(0, maxLength);
  std::uniform_int_distribution<int> byte(0, 255);
  std::string text(length(random), '\0');
  for (auto &c : text)
    c = static_cast<char>(byte(random));
  return text;
}

/// `text` with a few bytes changed, inserted, removed or repeated; inserted
/// bytes favour the characters that parsers treat specially.
std::string mutate(std::mt19937 &random, std::string text) {
  static const std::string special = "+-.eE ,;=<>/\"'\\\t\r\n0123456789";
  std::uniform_int_distribution<int> operation(0, 3);
  std::uniform_int_distribution<int> count(1, 4);
  for (int round = count(random); round > 0; --round) {
    std::uniform_int_distribution<std::size_t> position(0, text.size());
    const auto at = position(random);
    const char inserted = random() % 2 == 0 ? special[random() % special.size()] : static_cast<char>(random() % 256);
    // Change, insert, remove or repeat; the draws stay in this order so that the inputs do not change.
    const int kind = operation(random);
    if (kind == 0 && at < text.size())
      text[at] = inserted;
    else if (kind == 1)
      text.insert(at, 1, inserted);
    else if (kind == 2 && at < text.size())
      text.erase(at, 1 + random() % 3);
    else if (kind == 3)
      text.insert(at, text.substr(at, random() % 8));
  }
  return text;
}

/// Half random bytes, half mutations of one of the `seeds`.
std::string fuzzInput(std::mt19937 &random, const std::vector<std::string> &seeds) {
  return random() % 2 == 0 ? randomBytes(random, 64) : mutate(random, seeds[random() % seeds.size()]);
}

} // namespace

TEST(ToolsTest, FuzzedTextKeepsSplitTrimReplaceAndEnumerationsConsistent) {
  const std::vector<std::string> seeds{"Alpha, Beta", "a,,b", ",", "A, B, Gamma Delta", "  x  "};
  std::mt19937 random(fuzzSeed);
  for (int round = 0; round < fuzzRounds; ++round) {
    const auto text = fuzzInput(random, seeds);
    const auto other = fuzzInput(random, seeds).substr(0, 3);

    std::string rejoined = Tools::join(Tools::split(text, ','), ",");
    if (!text.empty() && text.back() == ',')
      rejoined += ',';
    ASSERT_EQ(rejoined, text);
    ASSERT_FALSE(Tools::split(text, other).empty());
    ASSERT_FALSE(Tools::splitTrim(text, other, " ").empty());

    const auto trimmed = Tools::trim(text, other);
    ASSERT_NE(text.find(trimmed), std::string::npos);
    ASSERT_EQ(Tools::replace(text, other, other), text);
    ASSERT_LE(Tools::replace(text, other, "").size(), text.size());

    const int index = static_cast<int>(random() % 8) - 2;
    const auto item = Tools::enumIndexToText(text, index);
    ASSERT_LE(item.size(), 255U);
    ASSERT_EQ(item.find_first_of(", "), std::string::npos);
    const int found = Tools::textToEnumIndex(text, other);
    ASSERT_GE(found, -1);
    ASSERT_LE(found, static_cast<int>(std::count(text.begin(), text.end(), ',')));
  }
}

TEST(ToolsTest, FuzzedNumbersParseOrFailOnlyAsDocumented) {
  const std::vector<std::string> seeds{"1.5e3", "-0.25E-2", " 42 ", "0x1F", "1 2", "5e", "+.5"};
  std::mt19937 random(fuzzSeed);
  for (int round = 0; round < fuzzRounds; ++round) {
    const auto text = fuzzInput(random, seeds);
    (void)Tools::parseInt32(text, 0);
    (void)Tools::parseInt64(text, 0);
    (void)Tools::parseFloat(text, 0);
    (void)Tools::parseDouble(text, 0);

    int integer = 17;
    const int base = static_cast<int>(random() % 42) - 2;
    if (!Tools::tryParse(text, integer, base)) {
      ASSERT_EQ(integer, 17);
    }

    double real = 17;
    try {
      if (!Tools::tryParse(text, real)) {
        ASSERT_EQ(real, 17);
      }
    } catch (const std::invalid_argument &) {
    } catch (const std::out_of_range &) {
    } catch (...) {
      FAIL() << "unexpected exception for \"" << text << "\"";
    }
  }
}

// ---- File readers -------------------------------------------------------------
// Fuzz cases of the configuration and XML readers go here; they take their
// inputs from fuzzInput() with fuzzSeed and fuzzRounds like the cases above.

TEST(ToolsTest, FuzzedConfigurationFilesReadWithoutHarm) {
  const std::vector<std::string> seeds{
      "name = \"Lumenbay\"\nurl=http://h/?a=b\n=x\nplain\n\r\n",
      "<?xml version=\"1.0\"?>\n<root>\n  <a id=\"1\">v</a>\n  <b>\ntext\n  </b>\n<c/>\n</root>\n",
      "<r>\n<!--\nnote\n-->\n<i><j>1</j>\n</i>\n<i>2</i>\n</r>\n"};
  constexpr int files = 400;
  const Corvane::Wavemill::Testing::TempDir dir;
  const auto path = dir.path("fuzz.txt");
  std::mt19937 random(fuzzSeed);
  for (int round = 0; round < files; ++round) {
    const auto text = random() % 4 == 0 ? randomBytes(random, 2048) : mutate(random, fuzzInput(random, seeds));
    Tools::writeText(path, text);
    const auto lines = static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n')) + 1;

    const auto config = Tools::readConfig(path, "=");
    ASSERT_LE(config.size(), lines);
    for (const auto &[key, value] : config) {
      ASSERT_EQ(key.find('='), std::string::npos);
      ASSERT_EQ(Tools::trim(key, "\t "), key);
      ASSERT_EQ(Tools::trim(value, "\t\"' "), value);
    }
    ASSERT_LE(Tools::readConfig(path, text.substr(0, 2)).size(), lines);

    // At most one element closes on a line, and each closing stores one entry.
    const auto xml = Tools::readXml(path);
    ASSERT_LE(xml.size(), lines);
    for (const auto &entry : xml)
      ASSERT_FALSE(entry.first.empty());
  }
}
