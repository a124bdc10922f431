#include "wavemill/instrument/IInstrument.h"

namespace Corvane::Wavemill {

// Out of line, so that the interface's type information lives in the library
// once and dynamic_cast works across modules.
IInstrument::~IInstrument() = default;

} // namespace Corvane::Wavemill
