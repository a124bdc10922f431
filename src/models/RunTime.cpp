#include "wavemill/models/RunTime.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <string_view>
#include <unordered_map>

namespace Corvane::Wavemill {

namespace {

bool isIdentifierStart(char c) { return std::isalpha(static_cast<unsigned char>(c)) != 0 || c == '_'; }

bool isIdentifierChar(char c) { return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '_'; }

std::string_view trim(std::string_view text) {
  while (!text.empty() && text.front() == ' ')
    text.remove_prefix(1);
  while (!text.empty() && text.back() == ' ')
    text.remove_suffix(1);
  return text;
}

using Bindings = std::unordered_map<std::string_view, std::string_view>;

void addBinding(std::string_view entry, Bindings &bindings) {
  const auto equals = entry.find(" = ");
  if (equals == std::string_view::npos)
    return;
  // A non-type parameter is written with its type in front ("int N = 3").
  auto name = trim(entry.substr(0, equals));
  if (const auto blank = name.rfind(' '); blank != std::string_view::npos)
    name.remove_prefix(blank + 1);
  // Only a plain identifier can be a template parameter; qualified entries
  // such as "std::string = ..." merely spell out aliases.
  if (name.empty() || !isIdentifierStart(name.front()) ||
      !std::all_of(name.begin(), name.end(), [](char c) { return isIdentifierChar(c); }))
    return;
  auto value = trim(entry.substr(equals + 3));
  // A parameter pack is listed in braces ("Ts = {int, char}").
  if (value.size() >= 2 && value.front() == '{' && value.back() == '}')
    value = trim(value.substr(1, value.size() - 2));
  bindings.emplace(name, value);
}

// The entries are separated by ";", which may also stand in a character
// argument ("char C = ';'") or, in principle, inside brackets of a value.
Bindings parseBindings(std::string_view clause) {
  Bindings bindings;
  int depth = 0;
  std::size_t start = 0;
  for (std::size_t i = 0; i < clause.size(); ++i) {
    const char c = clause[i];
    if (c == '\'') {
      for (++i; i < clause.size() && clause[i] != '\''; ++i)
        if (clause[i] == '\\')
          ++i;
    } else if (c == '<' || c == '(' || c == '[' || c == '{') {
      ++depth;
    } else if (c == '>' || c == ')' || c == ']' || c == '}') {
      --depth;
    } else if (c == ';' && depth == 0) {
      addBinding(clause.substr(start, i - start), bindings);
      start = i + 1;
    }
  }
  if (start < clause.size())
    addBinding(clause.substr(start), bindings);
  return bindings;
}

// Replaces every template parameter by its argument in one pass, so that an
// argument that happens to spell a parameter's name is not replaced again.
// A name next to "::" is a scope or a member, never a parameter.
std::string substitute(std::string_view text, const Bindings &bindings) {
  std::string out;
  out.reserve(text.size() * 2);
  std::size_t i = 0;
  while (i < text.size()) {
    if (!isIdentifierStart(text[i]) || (i > 0 && isIdentifierChar(text[i - 1]))) {
      out += text[i++];
      continue;
    }
    std::size_t end = i;
    while (end < text.size() && isIdentifierChar(text[end]))
      ++end;
    const auto name = text.substr(i, end - i);
    const bool scoped = (i >= 2 && text.substr(i - 2, 2) == "::") || text.substr(end, 2) == "::";
    const auto found = scoped ? bindings.end() : bindings.find(name);
    if (found == bindings.end()) {
      out += name;
    } else {
      out += found->second;
      // g++ itself writes a nested template's end as "> >"; the same blank
      // keeps the argument's own end apart from the class's.
      if (!found->second.empty() && found->second.back() == '>' && end < text.size() && text[end] == '>')
        out += ' ';
    }
    i = end;
  }
  return out;
}

std::string_view dropSpecifiers(std::string_view text) {
  static constexpr std::string_view specifiers[] = {"virtual ", "static ", "constexpr "};
  for (bool dropped = true; dropped;) {
    dropped = false;
    for (const auto specifier : specifiers)
      if (text.substr(0, specifier.size()) == specifier) {
        text.remove_prefix(specifier.size());
        dropped = true;
      }
  }
  return text;
}

} // namespace

int RunTime::lastIndexOf(const char *text, char wanted, int from) {
  if (text == nullptr || *text == '\0' || from < 0)
    return -1;
  // Nothing beyond the terminator belongs to the text.
  const auto last = std::min(static_cast<std::size_t>(from), std::strlen(text));
  for (auto i = static_cast<int>(last); i >= 0; --i)
    if (text[i] == wanted)
      return i;
  return -1;
}

std::string RunTime::getShortClassName(const std::string &name) {
  const int size = static_cast<int>(name.size());
  const int colon = lastIndexOf(name.c_str(), ':', size);
  if (colon > 0)
    return name.substr(colon + 1);
  // A blank in the very last place closes a nested template argument
  // ("class Foo> "); the blank that matters stands in front of the class.
  const int blank = lastIndexOf(name.c_str(), ' ', size - 2);
  if (blank >= 1)
    return name.substr(blank + 1);
  return name;
}

std::string RunTime::doGetFullTypeName(const char *signature, int size) {
  if (signature == nullptr)
    return {};
  const int p = lastIndexOf(signature, ':', size - 1);
  if (p - 2 >= 4 && signature[p - 2] == '>') {
    const int q = lastIndexOf(signature, '<', p - 3);
    if (q >= 1) {
      const std::string arg(signature + q + 1, signature + p - 2);
      const auto blank = arg.rfind(' ');
      const std::string inner = blank == std::string::npos || blank < 1 ? arg : arg.substr(blank + 1);
      if (!inner.empty()) {
        const int b2 = lastIndexOf(signature, ' ', q - 1);
        const int start = b2 < 1 ? 0 : b2 + 1;
        return std::string(signature + start, signature + q) + "`1[[" + inner + "]]";
      }
    }
  }
  const int s = lastIndexOf(signature, ' ', p - 2);
  std::string name;
  int colons = 0;
  for (int i = s + 1; i < p - 1; ++i) {
    if (signature[i] != ':')
      name += signature[i];
    else if (++colons % 2 == 0)
      name += '.';
  }
  return name;
}

std::string RunTime::doGetTypeName(const char *signature, int size) {
  if (signature == nullptr)
    return {};
  const int p = lastIndexOf(signature, ':', size - 1);
  if (p - 2 >= 4 && signature[p - 2] == '>') {
    const int q = lastIndexOf(signature, '<', p - 3);
    if (q >= 1) {
      const std::string inner = getShortClassName(std::string(signature + q + 1, signature + p - 2));
      if (!inner.empty()) {
        const int b2 = lastIndexOf(signature, ' ', q - 1);
        const int start = b2 < 1 ? 0 : b2 + 1;
        return getShortClassName(std::string(signature + start, signature + q)) + "`1[[" + inner + "]]";
      }
    }
  }
  int start = 0;
  for (int i = p - 2; i >= 0; --i)
    if (signature[i] == ':' || signature[i] == ' ') {
      start = signature[i] == ':' && i == 0 ? 0 : i + 1;
      break;
    }
  const int end = p - 1;
  return start < end ? std::string(signature + start, signature + end) : std::string();
}

std::string RunTime::adaptSignature(const char *prettyFunction) {
  if (prettyFunction == nullptr)
    return {};
  std::string_view text(prettyFunction);
  std::string_view clause;
  if (const auto with = text.find(" [with "); with != std::string_view::npos && text.back() == ']') {
    clause = text.substr(with + 7, text.size() - with - 8);
    text = text.substr(0, with);
  }
  const auto bindings = parseBindings(clause);

  // Behind the parameter list only qualifiers may follow ("const", "&&");
  // anything else is not the text of a member function and stays as it is.
  const auto close = text.rfind(')');
  if (close == std::string_view::npos)
    return substitute(dropSpecifiers(text), bindings);
  const auto qualifiers = text.substr(close + 1);
  if (!std::all_of(qualifiers.begin(), qualifiers.end(),
                   [](char c) { return c == ' ' || c == '&' || std::islower(static_cast<unsigned char>(c)); }))
    return substitute(dropSpecifiers(text), bindings);
  std::size_t open = close;
  for (int depth = 0;; --open) {
    if (text[open] == ')')
      ++depth;
    else if (text[open] == '(' && --depth == 0)
      break;
    if (open == 0)
      return substitute(dropSpecifiers(text), bindings);
  }
  return substitute(dropSpecifiers(text.substr(0, open)), bindings) + "(void)" + std::string(qualifiers);
}

std::string RunTime::fullTypeNameOf(const char *prettyFunction) {
  const auto signature = adaptSignature(prettyFunction);
  return doGetFullTypeName(signature.c_str(), static_cast<int>(signature.size()) + 1);
}

std::string RunTime::typeNameOf(const char *prettyFunction) {
  const auto signature = adaptSignature(prettyFunction);
  return doGetTypeName(signature.c_str(), static_cast<int>(signature.size()) + 1);
}

} // namespace Corvane::Wavemill
