#include "wavemill/models/ValueSetting.h"
#include "wavemill/models/NumericSetting.h"

namespace Corvane::Wavemill {

// The value types of the library are instantiated once, here, so that every
// module shares one definition and one type identity of each.
template class ValueSetting<int>;
template class ValueSetting<std::int64_t>;
template class ValueSetting<double>;
template class ValueSetting<bool>;
template class ValueSetting<std::string>;

template class NumericSetting<int>;
template class NumericSetting<std::int64_t>;
template class NumericSetting<double>;

} // namespace Corvane::Wavemill
