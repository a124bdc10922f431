#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ICollection.h"
#include "wavemill/models/IModel.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/tools/Tools.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// The descriptor of a registered model class: its prototype, the
/// prototype of a collection of it, and the module that holds its code.
struct WAVEMILL_API RuntimeTypeBase {
  virtual ~RuntimeTypeBase() = default;

  /// The name of the module (library or program) that defines the class,
  /// such as "wavemill" for a class of this library.
  virtual std::string getLibraryName() = 0;
  /// The class's one shared instance.
  virtual std::shared_ptr<IModel> getPrototype() = 0;
  /// True when `model` is an object of the described class.
  virtual bool isAssignableFrom(std::shared_ptr<IModel> model) const = 0;
  /// The prototype of a collection of the class; empty for a collection.
  virtual std::shared_ptr<ICollection> getCollection() = 0;
  /// The descriptor of a collection of the class; empty for a collection.
  virtual std::shared_ptr<RuntimeTypeBase> getCollectionRuntimeType() = 0;
};

/// Holds one empty function per class. Every module that instantiates the
/// template has a copy of its own, so the function's address tells which
/// module registered the class.
template <class T> class WAVEMILL_LOCAL TypeInstance {
public:
  static void staticFunction() {}
};

/// The descriptor of the model class `T`.
template <class T> struct RuntimeType : public RuntimeTypeBase {
  /// Set at registration to TypeInstance<T>::staticFunction of the
  /// registering module.
  void (*staticFunction)() = nullptr;

  /// Found from `staticFunction` on the first call and kept from then on.
  std::string getLibraryName() override {
    static const std::string name = Tools::getLibraryName(reinterpret_cast<void *>(staticFunction));
    return name;
  }
  std::shared_ptr<IModel> getPrototype() override { return Prototype::getInstance<T>(); }
  bool isAssignableFrom(std::shared_ptr<IModel> model) const override {
    return std::dynamic_pointer_cast<T>(model) != nullptr;
  }
  std::shared_ptr<ICollection> getCollection() override { return Prototype::getInstance<ModelCollection<T>>(); }
  std::shared_ptr<RuntimeTypeBase> getCollectionRuntimeType() override {
    return Prototype::getInstance<RuntimeType<ModelCollection<T>>>();
  }
};

/// The descriptor of a collection of `T`: it lives in the module of `T` and
/// has no collection of its own.
template <class T> struct RuntimeType<ModelCollection<T>> : public RuntimeTypeBase {
  void (*staticFunction)() = nullptr;

  /// The module of the item class, asked on the first call and kept.
  std::string getLibraryName() override {
    static const std::string name = Prototype::getInstance<RuntimeType<T>>()->getLibraryName();
    return name;
  }
  std::shared_ptr<IModel> getPrototype() override { return Prototype::getInstance<ModelCollection<T>>(); }
  bool isAssignableFrom(std::shared_ptr<IModel>) const override { return false; }
  std::shared_ptr<ICollection> getCollection() override { return nullptr; }
  std::shared_ptr<RuntimeTypeBase> getCollectionRuntimeType() override { return nullptr; }
};

} // namespace Corvane::Wavemill
