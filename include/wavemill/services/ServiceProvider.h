#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IService.h"

#include <memory>
#include <string>
#include <typeindex>
#include <unordered_map>

namespace Corvane::Wavemill {

/// Hands out services by name or by their exact class. The two lookups are
/// separate: a service added under a name is not found by its class, nor the
/// other way round. The process's shared provider is
/// Prototype::getInstance<ServiceProvider>().
///
/// Takes no lock: fill the provider while the application starts, then read
/// it from any thread.
class WAVEMILL_API ServiceProvider : public IServiceProvider {
public:
  using IServiceProvider::addService;
  using IServiceProvider::getService;

  ~ServiceProvider() override;

  /// Stores `service` under `name`, replacing an earlier entry. An empty
  /// pointer is stored as it is and later found as an empty pointer.
  void addService(const std::string &name, std::shared_ptr<IService> service) override;
  /// The service stored under `name`, or an empty pointer.
  std::shared_ptr<IService> getService(const std::string &name) override;

  /// Stores `service` under its dynamic class, replacing an earlier service
  /// of that class. An empty pointer is ignored.
  virtual void addService(std::shared_ptr<IService> service);
  /// The service stored for exactly the class `type`, or an empty pointer.
  /// A service of a subclass is not found under its base: after
  /// addService(std::make_shared<Log>()), getService(typeid(Log)) finds it
  /// and getService(typeid(LogBase)) does not.
  virtual std::shared_ptr<IService> getService(std::type_index type);

  /// "ServiceProvider".
  std::string toString() const override;

private:
  std::unordered_map<std::string, std::shared_ptr<IService>> byName;
  std::unordered_map<std::type_index, std::shared_ptr<IService>> byType;
};

} // namespace Corvane::Wavemill
