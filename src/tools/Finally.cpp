#include "wavemill/tools/Finally.h"

#include <utility>

namespace Corvane::Wavemill {

Finally::Finally(std::function<void()> action) : action(std::move(action)) {}

Finally::~Finally() {
  // An empty or throwing function leaves this noexcept destructor by an
  // exception and so ends the process: a clean-up that did not happen must
  // not pass unnoticed.
  action();
}

} // namespace Corvane::Wavemill
