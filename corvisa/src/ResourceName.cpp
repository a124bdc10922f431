#include "ResourceName.h"

#include <cstddef>
#include <vector>

namespace Corvane::Wavemill::CorVisa {

namespace {

char lower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

bool equalsIgnoringCase(const std::string &a, const char *b) {
  std::size_t i = 0;
  for (; i < a.size() && b[i] != '\0'; ++i)
    if (lower(a[i]) != lower(b[i]))
      return false;
  return i == a.size() && b[i] == '\0';
}

std::vector<std::string> splitAtDoubleColons(const std::string &name) {
  std::vector<std::string> parts;
  std::size_t start = 0;
  for (;;) {
    const std::size_t end = name.find("::", start);
    parts.push_back(name.substr(start, end == std::string::npos ? std::string::npos : end - start));
    if (end == std::string::npos)
      return parts;
    start = end + 2;
  }
}

// "TCPIP" and an optional board number.
bool isTcpipInterface(const std::string &part) {
  if (part.size() < 5 || !equalsIgnoringCase(part.substr(0, 5), "tcpip"))
    return false;
  for (std::size_t i = 5; i < part.size(); ++i)
    if (part[i] < '0' || part[i] > '9')
      return false;
  return true;
}

bool isValidHost(const std::string &host) {
  if (host.empty())
    return false;
  for (const char c : host) {
    const bool allowed =
        (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '.' || c == '-' || c == '_';
    if (!allowed)
      return false;
  }
  return true;
}

} // namespace

int parsePort(const std::string &text) {
  if (text.empty() || text.size() > 5)
    return 0;
  int port = 0;
  for (const char c : text) {
    if (c < '0' || c > '9')
      return 0;
    port = port * 10 + (c - '0');
  }
  return port <= 65535 ? port : 0;
}

bool parseResourceName(const std::string &name, int instrPort, ResourceAddress &address) {
  const auto parts = splitAtDoubleColons(name);
  if (parts.size() < 2 || parts.size() > 4 || !isTcpipInterface(parts[0]) || !isValidHost(parts[1]))
    return false;
  const std::string &last = parts.back();
  if (parts.size() > 2 && equalsIgnoringCase(last, "socket")) {
    if (parts.size() != 4 || parsePort(parts[2]) == 0)
      return false;
    address = {parts[1], parsePort(parts[2])};
    return true;
  }
  // The class INSTR may be left out, as VISA allows: "TCPIP::host::inst0".
  const bool classGiven = parts.size() > 2 && equalsIgnoringCase(last, "instr");
  const std::size_t deviceParts = parts.size() - 2 - (classGiven ? 1 : 0);
  if (deviceParts > 1 || (deviceParts == 1 && parts[2].empty()))
    return false;
  address = {parts[1], instrPort};
  return true;
}

bool matchesPattern(const std::string &pattern, const std::string &text) {
  // Greedy matching that goes back only to the latest "*": linear for
  // patterns with one star, never exponential.
  std::size_t p = 0, t = 0;
  std::size_t starAt = std::string::npos, resumeAt = 0;
  while (t < text.size()) {
    if (p < pattern.size() && (pattern[p] == '?' || (pattern[p] != '*' && lower(pattern[p]) == lower(text[t])))) {
      ++p;
      ++t;
    } else if (p < pattern.size() && pattern[p] == '*') {
      starAt = p++;
      resumeAt = t;
    } else if (starAt != std::string::npos) {
      p = starAt + 1;
      t = ++resumeAt;
    } else {
      return false;
    }
  }
  while (p < pattern.size() && pattern[p] == '*')
    ++p;
  return p == pattern.size();
}

} // namespace Corvane::Wavemill::CorVisa
