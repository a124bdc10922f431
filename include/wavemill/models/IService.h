#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IObject.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// A long-lived helper object with a small life cycle, found through an
/// IServiceProvider by name or by class.
class WAVEMILL_API IService : public IObject {
public:
  /// Prepares the service; called once before start().
  virtual void setup() = 0;
  /// Starts the service; true on success.
  virtual bool start() = 0;
  /// Stops the service; true on success.
  virtual bool stop() = 0;
  /// True while the service runs.
  virtual bool isRunning() const = 0;
};

/// Whatever hands out services by name.
class WAVEMILL_API IServiceProvider : public IObject {
public:
  /// Stores `service` under `name`, replacing an earlier entry.
  virtual void addService(const std::string &name, std::shared_ptr<IService> service) = 0;
  /// The service stored under `name`, or an empty pointer.
  virtual std::shared_ptr<IService> getService(const std::string &name) = 0;
};

} // namespace Corvane::Wavemill
