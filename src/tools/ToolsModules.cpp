#include "wavemill/tools/OperationSystem.h"
#include "wavemill/tools/Path.h"
#include "wavemill/tools/Tools.h"

#include "platform/Module.h"

#include <cstddef>
#include <string>

namespace Corvane::Wavemill {

namespace {

// The classic path limit and the longest path the system knows, terminating
// zero included; the short buffer has one character to spare so that a
// path of exactly the classic limit is told apart from a longer one.
constexpr std::size_t shortBuffer = 261;
constexpr std::size_t longBuffer = 32767;

// Asks with a short buffer first and again with the longest one when the
// path does not fit; an answer given under the long-path prefix loses it.
template <typename Query> std::string queryLongPath(Query query) {
  std::string path;
  auto result = query(shortBuffer, path);
  if (result == Platform::insufficientBuffer) {
    result = query(longBuffer, path);
  }
  if (result != 0) {
    return {};
  }
  if (Path::isLong(path)) {
    path = Tools::trimStart(path.substr(Path::longPrefix().size()), "\\/");
  }
  return path;
}

bool isDigits(const std::string &text) {
  return !text.empty() && text.find_first_not_of("0123456789") == std::string::npos;
}

// "libwavemill.so.0.1.0" -> "libwavemill.so": the version numbers after
// ".so" would otherwise end up in the stem.
std::string withoutSharedObjectVersion(const std::string &path) {
  const auto name = path.substr(path.find_last_of("/\\") + 1);
  for (auto so = name.find(".so"); so != std::string::npos; so = name.find(".so", so + 1)) {
    const auto rest = name.substr(so + 3);
    if (rest.empty()) {
      return path;
    }
    if (rest.front() != '.') {
      continue;
    }
    bool versionOnly = true;
    std::size_t start = 1;
    while (versionOnly && start <= rest.size()) {
      const auto dot = rest.find('.', start);
      const auto end = dot == std::string::npos ? rest.size() : dot;
      versionOnly = isDigits(rest.substr(start, end - start));
      start = end + 1;
    }
    if (versionOnly) {
      return path.substr(0, path.size() - rest.size());
    }
  }
  return path;
}

} // namespace

std::string Tools::getProcessPath(int pid) {
  return queryLongPath(
      [pid](std::size_t capacity, std::string &path) { return Platform::processImagePath(pid, capacity, path); });
}

std::string Tools::getExecutingFileName(void *address) {
  // Any function of the library lies in the library's own module.
  const void *inModule = address != nullptr ? address : reinterpret_cast<const void *>(&Tools::getExecutingFileName);
  std::string path;
  // This query knows only the classic limit: a longer path is no answer.
  return Platform::moduleFileNameOfAddress(inModule, shortBuffer - 1, path) == 0 ? path : std::string();
}

std::string Tools::getLibraryName(void *address) {
  auto path = getExecutingFileName(address);
  if (os().isLinux()) {
    path = withoutSharedObjectVersion(path);
  }
  auto stem = Path::splitShortName(path).first;
  if ((os().isLinux() || os().isApple()) && stem.compare(0, 3, "lib") == 0) {
    stem.erase(0, 3);
  }
  return stem;
}

std::string Tools::getModuleFileName(const std::string &moduleName) {
  return queryLongPath([&moduleName](std::size_t capacity, std::string &path) {
    return Platform::moduleFileNameByName(moduleName, capacity, path);
  });
}

} // namespace Corvane::Wavemill
