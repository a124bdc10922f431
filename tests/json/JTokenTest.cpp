#include "wavemill/json/JToken.h"

#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

std::shared_ptr<JValue> value(const std::string &name, const std::string &text) {
  return std::make_shared<JValue>(name, text);
}

// A root with "$type", a nested object, an array and a scalar, added out of
// order so that the writer has to sort.
std::shared_ptr<JObject> makeExample() {
  auto sub = std::make_shared<JObject>("Sub");
  sub->addToken(value("Value", "1"));
  sub->addToken(value("$type", "\"C\""));
  auto values = std::make_shared<JArray>("Values");
  values->addElement(value("", "1"));
  values->addElement(value("", "2"));
  auto root = std::make_shared<JObject>();
  root->addToken(value("Z", "2"));
  root->addToken(values);
  root->addToken(sub);
  root->addToken(value("$type", "\"A, B\""));
  return root;
}

std::string read(const std::shared_ptr<JContainer> &object, const std::string &name) {
  auto token = object->getItem(name);
  return token ? token->toString() : "<missing>";
}

std::shared_ptr<JObject> parseObject(const std::string &text, int &position) {
  auto object = std::make_shared<JObject>();
  object->parse(text, position);
  return object;
}

} // namespace

// The fixed layout with "$type" first is checked byte for byte by
// JsonSerializerTest on a whole document.
TEST(JTokenTest, WriterSortsMembersByUnsignedBytesAndSkipsEmptyTokens) {
  // Byte order is unsigned, empty tokens are skipped, and an object without
  // "$type" is written without that line and without a stray comma.
  JObject object;
  object.add("\xc3\xa9", value("", "3"));
  object.add("a", value("", "1"));
  object.add("Z", value("", "2"));
  object.add("gone", nullptr);
  EXPECT_EQ(object.toString(), "{\n  \"Z\": 2,\n  \"a\": 1,\n  \"\xc3\xa9\": 3\n}\n");
}

TEST(JTokenTest, EscapingTouchesOnlyQuotedTextAndRawUndoesIt) {
  EXPECT_EQ(JValue::toEscaped("\"a\tb\nc\rd\"e\\f'g\x01\xff\""), "\"a\\tb\\nc\\rd\\\"e\\\\f'g\x01\xff\"");
  EXPECT_EQ(JValue::toEscaped("'a\"b'"), "'a\\\"b'");
  for (const char *unchanged : {"\"", "\"a\tb'", "a\tb"})
    EXPECT_EQ(JValue::toEscaped(unchanged), unchanged);

  EXPECT_EQ(JValue::toRaw("\"a\\tb\\nc\\rd\\\"e\\\\f\\q\""), "\"a\tb\nc\rd\"e\\fq\"");
  EXPECT_EQ(JValue::toRaw("\"a\\\""), "\"a\""); // the escaped end mark is taken as a character
  for (const char *unchanged : {"\"\\\"", "\"a\"", "a\\tb", "\"a\\tb'"})
    EXPECT_EQ(JValue::toRaw(unchanged), unchanged);
}

TEST(JTokenTest, ValueReaderCountsOnlyBlanksAsWhiteSpaceAndStopsWhereTheLayoutWants) {
  const struct {
    const char *text;
    int from;
    const char *value;
    int position;
  } cases[] = {
      {": \t1,", 0, "\t1", 5},       // TAB is part of the value
      {"  5  , x", 0, "5", 5},       // a blank stops; position on the next non-blank
      {"7\r\n", 0, "7", 1},          // a CR stays for the caller
      {"8\n\n9", 0, "8", 3},         // LFs are skipped
      {"9}", 0, "9", 1},             // the object reads its own "}"
      {"\"a b\",", 0, "\"a b\"", 6}, // blanks inside the marks belong to the value
      {"abc", 0, "a", 0},            // no stop character: first character only
      {"x, 12 ", 2, "12", 2},        // nothing but blanks behind: position stays
      {"   ", 0, "old", 0},          // nothing to read: the value stays
  };
  for (const auto &c : cases) {
    JValue token("", "old");
    int position = c.from;
    token.parse(c.text, position);
    EXPECT_EQ(token.getValue(), c.value) << c.text;
    EXPECT_EQ(position, c.position) << c.text;
  }
}

TEST(JTokenTest, ObjectReaderHandlesEmptyMissingAndValuelessObjects) {
  const struct {
    const char *text;
    int from, position;
  } cases[] = {{" {} ", 1, 3}, {"\"a\": 1", 0, 0}, {"{\"a\"}", 0, 5}};
  for (const auto &c : cases) {
    int position = c.from;
    EXPECT_TRUE(parseObject(c.text, position)->getItems().empty()) << c.text;
    EXPECT_EQ(position, c.position) << c.text;
  }
}

TEST(JTokenTest, ObjectReaderTakesMembersTheWayItsScannerSeesThem) {
  const std::string words = "{\"t\": true, \"n\": null, \"x\": nan}";
  const std::string marks = "{\"a\": \"x\\\"y, z\", \"b\": 2}";
  const std::string repeated = "{\"a\": 1,\n\"b\": 3,\n\"a\": 2\n}";
  // The scan passes `null` and starts at the comma; "}" comes before any
  // value of "x"; no backslash protects a mark; a repeated name replaces
  // the member.
  const struct {
    const std::string &text;
    const char *name, *value;
  } cases[] = {{words, "t", "true"},     {words, "n", ","},         {words, "x", "<missing>"},
               {marks, "a", "\"x\\\"y"}, {marks, "b", "<missing>"}, {repeated, "a", "2"}};
  for (const auto &c : cases) {
    int position = 0;
    EXPECT_EQ(read(parseObject(c.text, position), c.name), c.value) << c.text << " " << c.name;
  }
  // Arrays pass over `true`; "]" does not end a scalar.
  int position = 0;
  auto object = parseObject("{\"a\": [true,\n1,\n\"x\"\n],\n\"b\": [1, 2]\n}", position);
  EXPECT_EQ(object->toString(), "{\n  \"a\": [\n    1,\n    \"x\"\n  ],\n  \"b\": [\n    1,\n    2]\n  ]\n}\n");
}

TEST(JTokenTest, ReaderReadsTheWritersOutputBack) {
  // Carriage returns, escaped as two characters each, outnumber the rest.
  const std::string quoted = "\"tab\there\nline\\slash\"q" + std::string(16, '\r') + "\"";
  auto root = makeExample();
  root->addToken(value("Text", quoted));
  const std::string text = root->toString();
  // The writer sizes the document before it writes, escapes included
  // (JsonSerializerTest sizes objects within arrays).
  EXPECT_EQ(text.capacity(), text.size());

  int position = 0;
  auto again = parseObject(text, position);
  EXPECT_EQ(position, static_cast<int>(text.size()) - 1); // behind the "}", before the final LF
  EXPECT_EQ(again->toString(), text);
}

// Hostile and damaged texts under the sanitizers: nothing may crash, hang or
// read outside the text, and `position` only moves forward within it.
TEST(JTokenTest, ReaderSurvivesDamagedTextsAndAnyPosition) {
  std::mt19937 random(20261123);
  const std::string document = makeExample()->toString();
  const std::string alphabet = "{}[]\":, \r\n\t\\'tfnTF019.-+$a";

  std::vector<std::string> texts = {"[1", "{\"a\": [1", "[ ", "[1\n", "[{", "{\"a\": {", "{\"a\": \"b", "{", ":"};
  for (std::size_t length = 0; length <= document.size(); ++length)
    texts.push_back(document.substr(0, length));
  for (int round = 0; round < 3000; ++round) {
    std::string text(random() % 120, '\0');
    for (auto &c : text)
      c = round % 2 ? static_cast<char>(random()) : alphabet[random() % alphabet.size()];
    texts.push_back(text);
  }

  for (const auto &text : texts) {
    const int size = static_cast<int>(text.size());
    for (const int from : {0, static_cast<int>(random() % (text.size() + 2)), size, size + 5, -1, -1000}) {
      const auto check = [&](JToken &token) {
        int position = from;
        token.parse(text, position);
        if (from < 0 || from > size)
          EXPECT_EQ(position, from) << text;
        else
          EXPECT_TRUE(position >= from && position <= size) << text;
      };
      JObject object;
      JArray array;
      JValue scalar("", "");
      check(object);
      check(array);
      check(scalar);
    }
  }

  // Nesting far beyond any model: the outer levels are read, the rest is not.
  std::string deep;
  for (int level = 0; level < 100000; ++level)
    deep += "{\"a\": [";
  int position = 0;
  auto object = parseObject(deep, position);
  EXPECT_TRUE(object->hasItem("a"));
  EXPECT_EQ(position, static_cast<int>(deep.size()));
}

// A damaged text without any stop character: every scalar runs to the end of
// the text, yet each member is read once and the read stays linear (this
// text would take minutes if each member searched the rest of it again).
TEST(JTokenTest, ReaderStaysLinearWithoutStopCharacters) {
  std::string text = "{";
  constexpr int members = 200000;
  for (int n = 0; n < members; ++n)
    text += "\"k" + std::to_string(n) + "\":1";
  int position = 0;
  auto object = parseObject(text, position);
  EXPECT_EQ(object->getItems().size(), static_cast<std::size_t>(members));
  ASSERT_TRUE(object->getItem("k123"));
  EXPECT_EQ(object->getItem("k123")->toString(), "1");
  EXPECT_EQ(position, static_cast<int>(text.size()));
}
