#pragma once

// corvisa, our VISA library, loaded by the real loader and its functions
// looked up by name, as a VISA client does.
#include "corvisa/corvisa.h"
#include "platform/Module.h"
#include "wavemill/tools/Tools.h"

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

namespace Corvane::Wavemill::Testing {

template <typename F> F corvisaFunction(const char *name) {
  static void *module = [] {
    std::string error;
    void *loaded = Platform::loadModule(WAVEMILL_CORVISA_LIBRARY, error);
    if (loaded == nullptr)
      throw std::runtime_error(error);
    return loaded;
  }();
  if (auto *function = reinterpret_cast<F>(Platform::moduleSymbol(module, name)))
    return function;
  throw std::runtime_error(std::string("libcorvisa has no ") + name);
}

#define CORVISA_FUNCTION(name) decltype(&::name) name = corvisaFunction<decltype(&::name)>(#name);
struct CorVisa {
  // clang-format off
  CORVISA_FUNCTION(viOpenDefaultRM) CORVISA_FUNCTION(viOpen) CORVISA_FUNCTION(viClose) CORVISA_FUNCTION(viClear)
  CORVISA_FUNCTION(viFindRsrc) CORVISA_FUNCTION(viFindNext) CORVISA_FUNCTION(viSetAttribute)
  CORVISA_FUNCTION(viGetAttribute) CORVISA_FUNCTION(viRead) CORVISA_FUNCTION(viWrite) CORVISA_FUNCTION(viStatusDesc)
  CORVISA_FUNCTION(corvisa_record) CORVISA_FUNCTION(corvisa_record_take)
  // clang-format on
};
#undef CORVISA_FUNCTION

inline const CorVisa &visa() {
  static const CorVisa table;
  return table;
}

/// The VISA calls corvisa records from here until stop(), one a line.
struct VisaCalls {
  VisaCalls() { visa().corvisa_record(1); }
  std::vector<std::string> stop() {
    visa().corvisa_record(0);
    std::string text(static_cast<std::size_t>(visa().corvisa_record_take(nullptr, 0)) + 1, '\0');
    text.resize(static_cast<std::size_t>(visa().corvisa_record_take(text.data(), static_cast<int>(text.size()))));
    return Tools::split(text, '\n');
  }
};

} // namespace Corvane::Wavemill::Testing
