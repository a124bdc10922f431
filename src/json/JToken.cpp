#include "wavemill/json/JToken.h"

#include <climits>
#include <cstddef>
#include <cstring>

namespace Corvane::Wavemill {

namespace {

constexpr std::size_t npos = std::string::npos;

const std::string typeKey = "$type";

// Containers nested deeper than this below the one a caller reads are not
// read: a hostile text of a million "{" must not exhaust the stack, and
// model documents stay far below it.
constexpr int maximumDepth = 512;

// Where reading starts, or npos when there is nothing to read. `position` is
// an int, so a text it cannot index in full is not read at all, and a
// negative position reads nothing rather than being guessed at.
std::size_t startOf(const std::string &text, int position) {
  if (position < 0 || text.size() > static_cast<std::size_t>(INT_MAX))
    return npos;
  return static_cast<std::size_t>(position);
}

bool isQuote(char c) { return c == '"' || c == '\''; }

bool isQuoted(const char *text, std::size_t size, std::size_t minimum) {
  return size >= minimum && isQuote(text[0]) && text[0] == text[size - 1];
}

std::size_t skipBlanks(const char *text, std::size_t size, std::size_t from) {
  while (from < size && text[from] == ' ')
    ++from;
  return from;
}

bool isStop(char c) { return c == ' ' || c == ',' || c == '\r' || c == '\n' || c == '}'; }

// The last search for a scalar's end during one read of a container. The
// reader asks at ever later places of the same text; when a damaged text
// has no stop character left, an uncached search would run to its end once
// per member and make reading quadratic. Only reads of containers use it,
// from the outermost call to its return, so it never outlives the text.
struct StopSearch {
  const char *text = nullptr;
  std::size_t size = 0;
  std::size_t from = 0;
  std::size_t found = npos;
  bool known = false;
};
thread_local StopSearch *activeSearch = nullptr;

class StopSearchScope {
public:
  explicit StopSearchScope(const std::string &text) : outer(activeSearch) {
    if (outer == nullptr) {
      own.text = text.data();
      own.size = text.size();
      activeSearch = &own;
    }
  }
  ~StopSearchScope() { activeSearch = outer; }
  StopSearchScope(const StopSearchScope &) = delete;
  StopSearchScope &operator=(const StopSearchScope &) = delete;

private:
  StopSearch *outer;
  StopSearch own;
};

// The first stop character at or after `from`, or npos.
std::size_t findStop(const char *text, std::size_t size, std::size_t from) {
  StopSearch *search = activeSearch;
  const bool cached = search != nullptr && search->text == text && search->size == size;
  if (cached && search->known && from >= search->from && (search->found == npos || from <= search->found))
    return search->found; // nothing stops between the last start and what it found
  std::size_t found = npos;
  for (std::size_t i = from; i < size; ++i)
    if (isStop(text[i])) {
      found = i;
      break;
    }
  if (cached) {
    search->from = from;
    search->found = found;
    search->known = true;
  }
  return found;
}

void appendBlanks(std::string &out, int count) {
  if (count > 0)
    out.append(static_cast<std::size_t>(count), ' ');
}

void appendEscaped(std::string &out, const std::string &text) {
  const std::size_t size = text.size();
  if (!isQuoted(text.data(), size, 2)) {
    out += text;
    return;
  }
  out += text[0];
  std::size_t plain = 1; // start of the stretch not yet copied
  for (std::size_t i = 1; i + 1 < size; ++i) {
    char escape;
    switch (text[i]) {
    case '\t':
      escape = 't';
      break;
    case '\n':
      escape = 'n';
      break;
    case '\r':
      escape = 'r';
      break;
    case '"':
    case '\\':
      escape = text[i];
      break;
    default:
      continue;
    }
    out.append(text, plain, i - plain);
    out += '\\';
    out += escape;
    plain = i + 1;
  }
  out.append(text, plain, size - 1 - plain);
  out += text[size - 1];
}

// toRaw of `size` characters at `text`, built straight into `out` so that a
// value read from a document is copied once.
void assignRaw(std::string &out, const char *text, std::size_t size) {
  if (!isQuoted(text, size, 4) || std::memchr(text, '\\', size) == nullptr) {
    out.assign(text, size);
    return;
  }
  out.clear();
  out.reserve(size);
  for (std::size_t i = 0; i < size; ++i) {
    char c = text[i];
    if (c == '\\') {
      // A backslash at the very end takes the terminator in its place.
      c = ++i < size ? text[i] : '\0';
      if (c == 'n')
        c = '\n';
      else if (c == 'r')
        c = '\r';
      else if (c == 't')
        c = '\t';
    }
    out += c;
  }
}

bool startsScalarInObject(char c) {
  return c == '"' || (c >= '+' && c <= '9') || c == 't' || c == 'T' || c == 'f' || c == 'F';
}

bool startsScalarInArray(char c) { return c == '"' || (c >= '+' && c <= '9' && c != ','); }

} // namespace

// ---- JToken --------------------------------------------------------------------

JToken::JToken(std::string name) : name(std::move(name)) {}

JToken::~JToken() = default;

std::string JToken::toString() const { return std::string(); }

int JToken::getTextSize() const { return 0; }

// ---- JValue --------------------------------------------------------------------

JValue::JValue(std::string name, std::string value) : JToken(std::move(name)), value(std::move(value)) {}

std::string JValue::toString() const { return value; }

void JValue::append(std::string &out, int) const {
  if (s_stringEscape)
    appendEscaped(out, value);
  else
    out += value;
}

std::string JValue::toEscaped(const std::string &text) {
  std::string out;
  out.reserve(text.size() + 8);
  appendEscaped(out, text);
  return out;
}

std::string JValue::toRaw(const std::string &text) {
  std::string out;
  assignRaw(out, text.data(), text.size());
  return out;
}

void JValue::parse(const std::string &text, int &position) {
  const std::size_t from = startOf(text, position);
  const char *s = text.data();
  const std::size_t size = text.size();
  if (from == npos || size == 0)
    return;
  std::size_t start = skipBlanks(s, size, from);
  if (start >= size)
    return;
  if (s[start] == ':') {
    start = skipBlanks(s, size, start + 1);
    if (start >= size)
      return;
  }

  // A backslash means nothing inside the quoted stretch: the next mark ends
  // it, escaped or not.
  std::size_t i = start + 1;
  if (s[start] == '"' && i < size) {
    const void *mark = std::memchr(s + i, '"', size - i);
    i = mark ? static_cast<std::size_t>(static_cast<const char *>(mark) - s) + 1 : size;
  }
  std::size_t end = start;
  if (i < size) {
    const std::size_t found = findStop(s, size, i);
    if (found != npos)
      end = found;
  }

  // The value is [start, stop) before trailing blanks are dropped.
  std::size_t stop = end + 1;
  switch (s[end]) {
  case ' ': {
    const std::size_t next = skipBlanks(s, size, end);
    if (next < size)
      position = static_cast<int>(next);
    break;
  }
  case ',':
    position = static_cast<int>(end + 1);
    stop = end;
    break;
  case '\r':
  case '\n': {
    // Only LFs are skipped: a CR is left for the caller's white space.
    std::size_t next = end;
    while (next < size && s[next] == '\n')
      ++next;
    if (next < size)
      position = static_cast<int>(next);
    stop = end;
    break;
  }
  case '}':
    position = static_cast<int>(end); // the object reads its own "}"
    stop = end;
    break;
  default:
    break;
  }
  while (stop > start && s[stop - 1] == ' ')
    --stop;
  assignRaw(value, s + start, stop > start ? stop - start : 0);
}

// ---- JContainer ----------------------------------------------------------------

JContainer::JContainer(std::string name) : JToken(std::move(name)) {}

void JContainer::add(const std::string &name, std::shared_ptr<JToken> token) {
  items.insert_or_assign(name, std::move(token));
  itemNames.push_back(name);
}

void JContainer::addToken(std::shared_ptr<JToken> token) {
  if (!token)
    return;
  itemNames.push_back(token->name);
  items.insert_or_assign(token->name, std::move(token));
}

bool JContainer::hasItem(const std::string &name) const { return items.find(name) != items.end(); }

std::shared_ptr<JToken> JContainer::getItem(const std::string &name) const {
  const auto found = items.find(name);
  return found == items.end() ? nullptr : found->second;
}

void JContainer::appendItem(std::string &out, const std::string &name, const std::shared_ptr<JToken> &token,
                            int indent) {
  out += '"';
  out += name;
  out += "\": ";
  token->append(out, indent);
}

void JContainer::append(std::string &out, int indent) const {
  if (indent < 0)
    indent = 0;
  out += "{\n";
  // A container without a "$type" token is written without that line (the
  // map is never touched by a lookup here), and its first member needs no
  // comma in front.
  bool first = true;
  const auto type = items.find(typeKey);
  if (type != items.end() && type->second) {
    appendBlanks(out, indent + 2);
    appendItem(out, typeKey, type->second, indent + 2);
    first = false;
  }
  for (const auto &item : items) {
    if (!item.second || item.first == typeKey)
      continue;
    if (!first)
      out += ",\n";
    first = false;
    appendBlanks(out, indent + 2);
    appendItem(out, item.first, item.second, indent + 2);
  }
  // The closing blanks come before the line end on purpose: readers of
  // these documents compare them byte for byte.
  appendBlanks(out, indent);
  out += '\n';
  appendBlanks(out, indent);
  out += "}\n";
}

// ---- JObject -------------------------------------------------------------------

JObject::JObject(std::string name) : JContainer(std::move(name)) {}

namespace {

std::size_t escapedSize(const std::string &text) {
  std::size_t size = text.size();
  if (!isQuoted(text.data(), size, 2))
    return size;
  for (std::size_t i = 1; i + 1 < text.size(); ++i) {
    const char c = text[i];
    size += (c == '\t' || c == '\n' || c == '\r' || c == '"' || c == '\\') ? 1 : 0;
  }
  return size;
}

// The exact length of what append() writes for `token` at `indent`, so that
// a document is written into a string of its final size: growing a string of
// megabytes step by step costs more than the whole walk.
std::size_t textSize(const JToken &token, int indent) {
  if (indent < 0)
    indent = 0;
  const auto blanks = static_cast<std::size_t>(indent);
  if (const auto *value = dynamic_cast<const JValue *>(&token))
    return escapedSize(value->getValue());
  if (const auto *array = dynamic_cast<const JArray *>(&token)) {
    std::size_t size = 2 + blanks + 1;
    std::size_t count = 0;
    for (const auto &element : array->getTokens())
      if (element) {
        size += blanks + 2 + textSize(*element, indent + 2);
        ++count;
      }
    return size + (count == 0 ? 0 : 2 * count - 1);
  }
  if (const auto *container = dynamic_cast<const JContainer *>(&token)) {
    std::size_t size = 2 + blanks + 1 + blanks + 2;
    std::size_t count = 0;
    for (const auto &item : container->getItems())
      if (item.second) {
        size += blanks + 2 + item.first.size() + 4 + textSize(*item.second, indent + 2);
        ++count;
      }
    return size + (count == 0 ? 0 : 2 * (count - 1));
  }
  return 0;
}

} // namespace

namespace {

// Where the members or elements of a container read from `position` begin:
// behind the first `bracket` at or after it, or npos when there is nothing to
// read. A container nested too deeply ends the whole read there.
std::size_t openContainer(const std::string &text, int &position, char bracket, int depth) {
  const std::size_t from = startOf(text, position);
  const std::size_t size = text.size();
  if (from == npos || from + 1 >= size)
    return npos;
  const std::size_t open = text.find(bracket, from);
  if (open == npos)
    return npos;
  if (depth > maximumDepth) {
    position = static_cast<int>(size);
    return npos;
  }
  return open + 1;
}

} // namespace

std::string JObject::toString() const {
  std::string result;
  result.reserve(textSize(*this, 0));
  append(result, 0);
  return result;
}

void JObject::parse(const std::string &text, int &position) { parseNested(text, position, 0); }

void JObject::parseNested(const std::string &text, int &position, int depth) {
  const std::size_t size = text.size();
  std::size_t i = openContainer(text, position, '{', depth);
  if (i == npos)
    return;
  const StopSearchScope search(text);
  const char *s = text.data();
  while (i < size) {
    if (s[i] == '}')
      break;
    // Whatever stands in front of the name (a comma, a line end) is passed.
    const std::size_t first = text.find('"', i);
    const std::size_t second = first == npos ? npos : text.find('"', first + 1);
    if (second == npos) {
      i = size;
      break;
    }
    // `null` and other bare words are passed over like ":" and blanks.
    i = second + 1;
    while (i < size && s[i] != '}' && s[i] != '{' && s[i] != '[' && !startsScalarInObject(s[i]))
      ++i;
    if (i >= size || s[i] == '}')
      continue; // no value: nothing is stored

    std::string name(s + first + 1, second - first - 1);
    int at = static_cast<int>(i);
    auto token = readToken(text, at, name, depth);
    // Every round ends behind the name's closing mark, so the loop always
    // moves on. Members mostly come in ascending order, hence the hint.
    i = static_cast<std::size_t>(at);
    items.insert_or_assign(items.end(), name, std::move(token));
    if (itemNames.empty())
      itemNames.reserve(8); // one allocation for the members of a usual model
    itemNames.push_back(std::move(name));

    while (i < size && (s[i] == ' ' || s[i] == '\r' || s[i] == '\n' || s[i] == '\t'))
      ++i;
  }
  position = static_cast<int>(i < size ? i + 1 : size);
}

std::shared_ptr<JToken> JObject::readToken(const std::string &text, int &position, std::string name, int depth) {
  const char first = text[static_cast<std::size_t>(position)];
  if (first == '{') {
    auto object = std::make_shared<JObject>(std::move(name));
    object->parseNested(text, position, depth + 1);
    return object;
  }
  if (first == '[') {
    auto array = std::make_shared<JArray>(std::move(name));
    array->parseNested(text, position, depth + 1);
    return array;
  }
  auto value = std::make_shared<JValue>(std::move(name), std::string());
  value->parse(text, position);
  return value;
}

// ---- JArray --------------------------------------------------------------------

JArray::JArray(std::string name) : JContainer(std::move(name)) {}

void JArray::append(std::string &out, int indent) const {
  if (indent < 0)
    indent = 0;
  out += "[\n";
  bool first = true;
  for (const auto &token : tokens) {
    if (!token)
      continue;
    if (!first)
      out += ",\n";
    first = false;
    appendBlanks(out, indent + 2);
    token->append(out, indent + 2);
  }
  if (!first)
    out += '\n';
  appendBlanks(out, indent);
  out += ']';
}

void JArray::parse(const std::string &text, int &position) { parseNested(text, position, 0); }

void JArray::addElement(std::shared_ptr<JToken> token) { tokens.push_back(std::move(token)); }

void JArray::parseNested(const std::string &text, int &position, int depth) {
  const std::size_t size = text.size();
  std::size_t i = openContainer(text, position, '[', depth);
  if (i == npos)
    return;
  const StopSearchScope search(text);
  const char *s = text.data();
  while (i < size) {
    if (s[i] == ']')
      break;
    // Commas, `true` and `false` are passed over and give no element.
    while (i < size && s[i] != ']' && s[i] != '{' && s[i] != '[' && !startsScalarInArray(s[i]))
      ++i;
    if (i >= size || s[i] == ']')
      continue;

    const std::size_t begin = i;
    int at = static_cast<int>(i);
    tokens.push_back(JObject::readToken(text, at, std::string(), depth));
    // An element that did not move on has run into the end of the text: a
    // scalar with no stop character or only blanks or LFs behind it, or a
    // "{" or "[" as the last character. Scanning from the same place again
    // would never end, so the array ends with the text.
    i = static_cast<std::size_t>(at) > begin ? static_cast<std::size_t>(at) : size;
  }
  position = static_cast<int>(i < size ? i + 1 : size);
}

} // namespace Corvane::Wavemill
