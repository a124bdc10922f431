#pragma once

#include "wavemill/Export.h"
#include "wavemill/services/Library.h"

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// Answers which modules have contributed model classes, from the
/// descriptors in the shared ModelContainer.
///
/// The list is built on the first call and kept; modules loaded later
/// appear after a call with `reload` set. Not safe against a parallel call.
class WAVEMILL_API LibraryService {
public:
  using Libraries = std::map<std::string, std::shared_ptr<Library>>;

  /// The libraries by ascending name, rebuilt when the list is empty or
  /// `reload` is true. A library's index is its order of first appearance
  /// among the registered classes.
  std::vector<std::shared_ptr<Library>> getLibraries(bool reload);
  /// The names of getLibraries(false), in the same order.
  std::vector<std::string> getNames();
  /// The map of libraries itself.
  Libraries &getMap() { return libraries; }

private:
  Libraries libraries;
  std::uint32_t nextIndex = 0;
};

} // namespace Corvane::Wavemill
