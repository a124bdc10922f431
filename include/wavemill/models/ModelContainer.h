#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ICollection.h"
#include "wavemill/models/IModel.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/RuntimeType.h"

#include <map>
#include <memory>
#include <string>
#include <typeindex>
#include <vector>

namespace Corvane::Wavemill {

/// The list of all registered model classes: one prototype per class in
/// order of registration, and each class's descriptor keyed by its type.
/// Classes register here when their module is loaded (see
/// WAVEMILL_REGISTER_MODEL); the one container is
/// Prototype::getInstance<ModelContainer>().
///
/// The container takes no lock: it is filled while modules load and the
/// application starts, and must not be written while another thread reads.
class WAVEMILL_API ModelContainer {
public:
  using Models = std::vector<std::shared_ptr<IModel>>;
  using RuntimeTypes = std::map<std::type_index, std::shared_ptr<RuntimeTypeBase>>;

  /// Registers the class of `model` with its descriptor `type` and appends
  /// its prototype. A class that is known already keeps its first
  /// descriptor.
  void add(std::shared_ptr<IModel> model, std::shared_ptr<RuntimeTypeBase> type);
  /// Gives each collection held by a registered model a descriptor, when
  /// the class of its items is registered.
  void addCollectionRuntimeTypes();
  /// The prototype of a collection of `model`'s class, or empty when the
  /// class is unknown or has no collection.
  std::shared_ptr<ICollection> getCollectionPrototype(std::shared_ptr<IModel> model);
  /// Gives every registered class its saved name under `assemblyName` and
  /// `namespaceName`, collections of registered classes included.
  void updateFullTypeNamesInternal(std::string assemblyName, std::string namespaceName);
  /// Stores the saved name of `model`'s class in `model`'s metadata under
  /// "FullTypeName": "Namespace.Type, Assembly" for a class, the .NET
  /// collection name for a collection.
  static void updateFullTypeName(std::string assemblyName, std::string namespaceName, std::shared_ptr<IModel> model);

  /// The prototypes in order of registration.
  const Models &getModels() const { return models; }
  Models::const_iterator begin() const { return models.begin(); }
  Models::const_iterator end() const { return models.end(); }
  /// The descriptors, by type.
  const RuntimeTypes &getRuntimeTypes() const { return runtimeTypes; }

private:
  Models models;
  RuntimeTypes runtimeTypes;
};

/// Registers the model class `T` with the shared container at load time;
/// see WAVEMILL_REGISTER_MODEL.
template <class T> class ModelRegistration {
public:
  ModelRegistration() {
    auto prototype = Prototype::getInstance<T>();
    auto type = Prototype::getInstance<RuntimeType<T>>();
    type->staticFunction = &TypeInstance<T>::staticFunction;
    Prototype::getInstance<ModelContainer>()->add(prototype, type);
  }
};

} // namespace Corvane::Wavemill

#define WAVEMILL_REGISTRATION_NAME_(line) wavemillModelRegistration##line
#define WAVEMILL_REGISTRATION_NAME(line) WAVEMILL_REGISTRATION_NAME_(line)

/// At namespace scope of a source file: makes the model class `Class`
/// known to documents when the module that holds the file is loaded,
/// without an explicit Activator::registerType. The class is listed under
/// that module's name. Running it more than once is harmless.
///
///   WAVEMILL_REGISTER_MODEL(MyApp::Generator)
#define WAVEMILL_REGISTER_MODEL(Class)                                                                                 \
  static const ::Corvane::Wavemill::ModelRegistration<Class> WAVEMILL_REGISTRATION_NAME(__LINE__);
