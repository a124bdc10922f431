#include "wavemill/models/SettingVisitor.h"

namespace Corvane::Wavemill {

SettingVisitor::~SettingVisitor() = default;
void SettingVisitor::dispatch(ISetting *) {}
void SettingVisitor::dispatch(ContextSetting *) {}
void SettingVisitor::dispatch(StringSetting *) {}
void SettingVisitor::dispatch(Int64Setting *) {}
void SettingVisitor::dispatch(Int32Setting *) {}
void SettingVisitor::dispatch(DoubleSetting *) {}
void SettingVisitor::dispatch(BoolSetting *) {}

} // namespace Corvane::Wavemill
