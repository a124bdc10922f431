#include "wavemill/models/ActionSetting.h"

namespace Corvane::Wavemill {

// The flag words are part of saved documents and of applications' code.
static_assert(static_cast<std::uint32_t>(ActionSetting::ActionBits) == 0x8300);

ActionSetting::ActionSetting(const char *name) : ContextSetting(name, ActionBits) {}

ActionSetting *ActionSetting::add(Handler handler) {
  handlers.push_back(std::move(handler));
  return this;
}

void ActionSetting::invoke() {
  // A handler may add handlers; indexing keeps the walk valid then.
  for (std::size_t i = 0; i < handlers.size(); ++i) {
    Handler handler = handlers[i];
    handler(this);
  }
}

} // namespace Corvane::Wavemill
