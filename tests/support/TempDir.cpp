#include "support/TempDir.h"

#include <filesystem>
#include <random>
#include <system_error>

namespace fs = std::filesystem;

namespace Corvane::Wavemill::Testing {

TempDir::TempDir() {
  const auto base = fs::temp_directory_path();
  std::random_device seed;
  std::mt19937_64 random(seed());
  // Parallel test processes share the temporary folder; a name that is taken
  // is simply drawn again.
  for (;;) {
    const auto candidate = base / ("wavemill-test-" + std::to_string(random()));
    if (fs::create_directory(candidate)) {
      folder = candidate.string();
      return;
    }
  }
}

TempDir::~TempDir() {
  std::error_code ignored;
  fs::remove_all(folder, ignored);
}

std::string TempDir::path(const std::string &name) const { return folder + "/" + name; }

} // namespace Corvane::Wavemill::Testing
