// A module of model classes that registers them while it loads, as an
// application's plug-in would. The tests load it at run time and reach the
// classes only through the registry.

#include "wavemill/models/ModelBase.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/ModelContainer.h"
#include "wavemill/models/SubSetting.h"

#include <memory>

namespace Plugins {

class Marker : public Corvane::Wavemill::ModelBase {
public:
  WAVEMILL_MODEL(Marker)
  Marker() : ModelBase("Plugins::Marker") {}
};

class Sweep : public Corvane::Wavemill::ModelBase {
public:
  WAVEMILL_MODEL(Sweep)
  Sweep() : ModelBase("Plugins::Sweep") {}
  const std::shared_ptr<Corvane::Wavemill::SubSetting<Corvane::Wavemill::ModelCollection<Marker>>> Markers =
      init(std::make_shared<Corvane::Wavemill::SubSetting<Corvane::Wavemill::ModelCollection<Marker>>>("Markers"));
};

} // namespace Plugins

WAVEMILL_REGISTER_MODEL(Plugins::Marker)
WAVEMILL_REGISTER_MODEL(Plugins::Sweep)
