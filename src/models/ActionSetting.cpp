#include "wavemill/models/ActionSetting.h"

namespace Corvane::Wavemill {

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
