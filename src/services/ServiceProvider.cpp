#include "wavemill/services/ServiceProvider.h"

#include <typeinfo>
#include <utility>

namespace Corvane::Wavemill {

ServiceProvider::~ServiceProvider() = default;

void ServiceProvider::addService(const std::string &name, std::shared_ptr<IService> service) {
  byName[name] = std::move(service);
}

std::shared_ptr<IService> ServiceProvider::getService(const std::string &name) {
  const auto found = byName.find(name);
  return found == byName.end() ? nullptr : found->second;
}

void ServiceProvider::addService(std::shared_ptr<IService> service) {
  if (!service)
    return;
  const IService &object = *service;
  byType[std::type_index(typeid(object))] = std::move(service);
}

std::shared_ptr<IService> ServiceProvider::getService(std::type_index type) {
  const auto found = byType.find(type);
  return found == byType.end() ? nullptr : found->second;
}

std::string ServiceProvider::toString() const { return "ServiceProvider"; }

} // namespace Corvane::Wavemill
