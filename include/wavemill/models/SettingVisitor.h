#pragma once

#include "wavemill/Export.h"

namespace Corvane::Wavemill {

class ISetting;
class ContextSetting;
class StringSetting;
class Int64Setting;
class Int32Setting;
class DoubleSetting;
class BoolSetting;

/// Double dispatch over the concrete setting classes: a setting's visit()
/// calls the overload for its own class. Sub-model holders and enum settings
/// call the ISetting overload. Every overload does nothing by default, so a
/// visitor overrides only what it handles.
class WAVEMILL_API SettingVisitor {
public:
  virtual ~SettingVisitor();
  virtual void dispatch(ISetting *setting);
  virtual void dispatch(ContextSetting *setting);
  virtual void dispatch(StringSetting *setting);
  virtual void dispatch(Int64Setting *setting);
  virtual void dispatch(Int32Setting *setting);
  virtual void dispatch(DoubleSetting *setting);
  virtual void dispatch(BoolSetting *setting);
};

} // namespace Corvane::Wavemill
