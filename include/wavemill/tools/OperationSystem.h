#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IObject.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// Names a platform: its type, full name and version.
class WAVEMILL_API OperationSystem : public IObject {
public:
  enum Type { Apple = 0, Windows = 1, Linux = 2 };

  /// A Windows system with empty names.
  OperationSystem();
  explicit OperationSystem(Type type);
  ~OperationSystem() override;

  /// True for a system with the same type and names.
  bool equals(const std::shared_ptr<IObject> &other) const override;
  /// "Apple", "Linux", or "Windows" for any other type.
  std::string toString() const override;
  virtual Type getType();
  virtual void setType(Type value);
  virtual std::string getFullName() const;
  virtual void setFullName(std::string value);
  virtual std::string getVersion() const;
  virtual void setVersion(std::string value);

  bool isApple() const { return type == Apple; }
  bool isLinux() const { return type == Linux; }
  bool isWindows() const { return type == Windows; }

protected:
  Type type;
  std::string fullName;
  std::string version;
};

class WAVEMILL_API AppleOperationSystem : public OperationSystem {
public:
  AppleOperationSystem() : OperationSystem(Apple) {}
};

class WAVEMILL_API LinuxOperationSystem : public OperationSystem {
public:
  LinuxOperationSystem() : OperationSystem(Linux) {}
};

class WAVEMILL_API WindowsOperationSystem : public OperationSystem {
public:
  WindowsOperationSystem() : OperationSystem(Windows) {}
};

} // namespace Corvane::Wavemill
