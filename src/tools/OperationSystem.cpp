#include "wavemill/tools/OperationSystem.h"

#include <utility>

namespace Corvane::Wavemill {

OperationSystem::OperationSystem() : OperationSystem(Windows) {}

OperationSystem::OperationSystem(Type type) : type(type) {}

OperationSystem::~OperationSystem() = default;

bool OperationSystem::equals(const std::shared_ptr<IObject> &other) const {
  const auto system = std::dynamic_pointer_cast<OperationSystem>(other);
  return system != nullptr && system->type == type && system->fullName == fullName && system->version == version;
}

std::string OperationSystem::toString() const {
  switch (type) {
  case Apple:
    return "Apple";
  case Linux:
    return "Linux";
  default:
    return "Windows";
  }
}

OperationSystem::Type OperationSystem::getType() { return type; }

void OperationSystem::setType(Type value) { type = value; }

std::string OperationSystem::getFullName() const { return fullName; }

void OperationSystem::setFullName(std::string value) { fullName = std::move(value); }

std::string OperationSystem::getVersion() const { return version; }

void OperationSystem::setVersion(std::string value) { version = std::move(value); }

} // namespace Corvane::Wavemill
