#include "wavemill/models/Couplings.h"

namespace Corvane::Wavemill {

std::string ICouplings::toString() const { return "Couplings"; }

void Couplings::couple(ModelBase *model, Transaction *transaction) {
  if (function)
    function(model, transaction);
}

} // namespace Corvane::Wavemill
