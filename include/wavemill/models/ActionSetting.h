#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ContextSetting.h"

#include <functional>
#include <memory>
#include <vector>

namespace Corvane::Wavemill {

/// A named command. It carries no change of value; invoke() calls its
/// handlers in the order they were added, on the caller's thread and
/// without a transaction.
class WAVEMILL_API ActionSetting : public ContextSetting {
public:
  using Handler = std::function<void(ActionSetting *)>;

  /// The flag word of an action setting: 0x8300.
  static constexpr ParameterBits ActionBits =
      ParameterBits::PlainSettingMark | ParameterBits::ContextKind | ParameterBits::ActionKind;

  explicit ActionSetting(const char *name = "");

  /// Appends `handler` and returns this setting, so that calls chain.
  virtual ActionSetting *add(Handler handler);
  /// Calls every handler with this setting. An empty handler throws
  /// std::bad_function_call; a handler's exception ends the walk and reaches
  /// the caller.
  virtual void invoke();

  /// Settings that belong to the action; kept and destroyed with it.
  std::vector<std::shared_ptr<Setting>> &getSettings() { return settings; }

protected:
  std::vector<Handler> handlers;
  std::vector<std::shared_ptr<Setting>> settings;
};

} // namespace Corvane::Wavemill
