#include "wavemill/tools/Tools.h"

#include "tools/Slashes.h"

#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

namespace Corvane::Wavemill {

namespace {

// Opens `path` for reading. A folder opens on this system but reads nothing
// sensible (its end may even lie at the largest offset), so it does not count.
bool openForReading(std::ifstream &stream, const std::string &path, std::ios::openmode mode) {
  const auto file = forwardSlashes(path);
  std::error_code error;
  if (file.empty() || std::filesystem::is_directory(file, error)) {
    return false;
  }
  stream.open(file, mode);
  return stream.is_open();
}

// Reads the next line as a text-mode read on Windows gives it: a carriage
// return before the line feed is no part of the line.
bool nextLine(std::istream &stream, std::string &line) {
  if (!std::getline(stream, line)) {
    return false;
  }
  if (!line.empty() && line.back() == '\r') {
    line.pop_back();
  }
  return true;
}

// The state of readXml between lines: the open elements, the key of the
// innermost one and the content gathered for it.
class XmlReader {
public:
  void readLine(std::string line) {
    line = Tools::trimEnd(line, "\t ");
    if (skipComment(line)) {
      return;
    }
    const auto open = line.find('<');
    auto close = line.find('>');
    if (open == std::string::npos && close == std::string::npos) {
      gathered += line;
      return;
    }
    if (open != std::string::npos && close != std::string::npos && close < open) {
      // A stray ">" before the tag ("a > b <c>") must not cut the tag.
      close = line.find('>', open);
    }
    if (open == std::string::npos || close == std::string::npos) {
      return;
    }
    const auto tag = line.substr(open + 1, close - open - 1);
    // Declarations, processing instructions and comments carry no values.
    if (tag.empty() || tag.front() == '?' || tag.front() == '!') {
      return;
    }
    const auto name = Tools::trim(tag, "/ ");
    if (name.empty()) {
      return;
    }
    if (tag.front() == '/') {
      if (!elements.empty() && name == elements.back().name) {
        closeElement(gathered);
      }
      return;
    }
    openElement(name.substr(0, name.find_first_of(" \t")));
    closeOnSameLine(line, close);
  }

  std::map<std::string, std::string> entries;

private:
  struct Element {
    std::string name;
    std::size_t parentKeyLength;
  };

  // A comment that runs over several lines would otherwise hand its text to
  // the element around it.
  bool skipComment(const std::string &line) {
    if (inComment) {
      inComment = line.find("-->") == std::string::npos;
      return true;
    }
    const auto start = line.find("<!--");
    if (start != std::string::npos && line.find("-->", start + 4) == std::string::npos) {
      inComment = true;
      return true;
    }
    return false;
  }

  // The first opening of a key keeps it; the next ones are numbered key.1,
  // key.2 ... so that every repeated element and its children stay
  // reachable. XML names never start with a digit, so a number cannot clash
  // with the name of a child.
  void openElement(const std::string &name) {
    elements.push_back({name, key.size()});
    if (!key.empty()) {
      key += '.';
    }
    key += name;
    const auto openings = ++counts[key];
    if (openings > 1) {
      key += '.' + std::to_string(openings - 1);
    }
  }

  void closeElement(const std::string &value) {
    entries[key] = value;
    key.resize(elements.back().parentKeyLength);
    elements.pop_back();
    gathered.clear();
  }

  // <leaf>value</leaf> on one line.
  void closeOnSameLine(const std::string &line, std::size_t tagEnd) {
    const auto next = line.find('<', tagEnd + 1);
    if (next == std::string::npos || next + 1 >= line.size() || line[next + 1] != '/') {
      return;
    }
    const auto end = line.find('>', next);
    if (end == std::string::npos) {
      return;
    }
    if (Tools::trim(line.substr(next + 2, end - next - 2), "/ ") == elements.back().name) {
      closeElement(line.substr(tagEnd + 1, next - tagEnd - 1));
    }
  }

  std::vector<Element> elements;
  std::string key;
  std::string gathered;
  std::map<std::string, int> counts;
  bool inComment = false;
};

} // namespace

std::map<std::string, std::string> Tools::readConfig(const std::string &path, const std::string &delimiters) {
  std::map<std::string, std::string> entries;
  std::ifstream stream;
  if (!openForReading(stream, path, std::ios::in)) {
    return entries;
  }
  std::string line;
  while (nextLine(stream, line)) {
    const auto text = trim(line, "\t ");
    const auto delimiter = text.find_first_of(delimiters);
    if (delimiter == std::string::npos) {
      if (delimiters != "=") {
        entries[text] = std::string();
      }
      continue;
    }
    entries[trim(text.substr(0, delimiter), "\t ")] = trim(text.substr(delimiter + 1), "\t\"' ");
  }
  return entries;
}

std::map<std::string, std::string> Tools::readXml(const std::string &path) {
  std::ifstream stream;
  if (!openForReading(stream, path, std::ios::in)) {
    return {};
  }
  XmlReader reader;
  std::string line;
  while (nextLine(stream, line)) {
    reader.readLine(line);
  }
  return std::move(reader.entries);
}

std::vector<std::string> Tools::readLines(const std::string &path) {
  std::vector<std::string> lines;
  std::ifstream stream;
  if (!openForReading(stream, path, std::ios::in)) {
    return lines;
  }
  std::string line;
  while (nextLine(stream, line)) {
    lines.push_back(line);
  }
  return lines;
}

std::string Tools::readText(const std::string &path) {
  std::ifstream stream;
  if (!openForReading(stream, path, std::ios::in)) {
    return {};
  }
  return std::string(std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>());
}

std::shared_ptr<std::vector<unsigned char>> Tools::readFile(const std::string &path) {
  auto bytes = std::make_shared<std::vector<unsigned char>>();
  std::ifstream stream;
  if (!openForReading(stream, path, std::ios::in | std::ios::binary)) {
    return bytes;
  }
  stream.seekg(0, std::ios::end);
  const auto size = static_cast<std::streamoff>(stream.tellg());
  if (size <= 0) {
    return bytes;
  }
  stream.seekg(0, std::ios::beg);
  bytes->resize(static_cast<std::size_t>(size));
  stream.read(reinterpret_cast<char *>(bytes->data()), size);
  // A file that shrank since its size was taken yields what is left.
  bytes->resize(static_cast<std::size_t>(stream.gcount()));
  return bytes;
}

void Tools::writeText(const std::string &path, const std::string &text) {
  std::ofstream stream(forwardSlashes(path));
  stream << text;
}

void Tools::writeFile(const std::string &path, const std::vector<unsigned char> &data) {
  std::ofstream stream(forwardSlashes(path), std::ios::binary);
  stream.write(reinterpret_cast<const char *>(data.data()), static_cast<std::streamsize>(data.size()));
}

void Tools::openWrite(std::ofstream &stream, const std::string &path, std::int64_t size) {
  const auto file = forwardSlashes(path);
  if (stream.is_open()) {
    stream.close();
  }
  stream.clear();
  stream.open(file, std::ios::out | std::ios::trunc | std::ios::binary);
  if (!stream.is_open() || size <= 0) {
    return;
  }
  stream.seekp(static_cast<std::streamoff>(size - 1));
  stream.put('\0');
  stream.close();
  if (stream.fail()) {
    // The file could not take its size; the caller sees a failed stream.
    return;
  }
  // Opening for update keeps the size that truncation would throw away.
  stream.open(file, std::ios::in | std::ios::out | std::ios::binary);
}

} // namespace Corvane::Wavemill
