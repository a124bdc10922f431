#include "wavemill/models/IObject.h"

namespace Corvane::Wavemill {

IObject::~IObject() = default;

bool IObject::equals(const std::shared_ptr<IObject> &other) const { return other.get() == this; }

} // namespace Corvane::Wavemill
