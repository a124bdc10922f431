#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IModel.h"
#include "wavemill/models/IObject.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// A module (library or program) that contributes model classes, with the
/// prototypes of its classes.
class WAVEMILL_API Library : public IObject {
public:
  Library(std::uint64_t index, std::string name);

  /// Appends the prototype of a class of this module.
  void addModel(std::shared_ptr<IModel> model);
  /// The running number, in order of first appearance.
  std::uint64_t getIndex() const { return index; }
  /// The module's name, such as "wavemill".
  std::string getName() const { return name; }
  /// A copy of the prototypes, in order of addition.
  std::vector<std::shared_ptr<IModel>> getModels() const { return models; }

  /// The module's name.
  std::string toString() const override { return name; }

  /// The name of the module that holds `address`; see Tools::getLibraryName.
  static std::string getLibraryName(void *address);

private:
  std::uint64_t index;
  std::string name;
  std::vector<std::shared_ptr<IModel>> models;
};

} // namespace Corvane::Wavemill
