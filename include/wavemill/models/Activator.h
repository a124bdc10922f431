#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ICollection.h"
#include "wavemill/models/IModel.h"
#include "wavemill/models/ModelContainer.h"
#include "wavemill/models/Prototype.h"

#include <cstddef>
#include <memory>
#include <string>
#include <tuple>
#include <unordered_map>
#include <vector>

namespace Corvane::Wavemill {

/// Turns a class's saved name into a new model and a model into the name it
/// is saved under. Names have the form of .NET assembly-qualified names,
/// "Namespace.Type, Assembly" for a class and
/// "System.Collections.ObjectModel.Collection`1[[<item name>]], mscorlib"
/// for a collection; a name is also found by its full form and by its short
/// form, so documents written under another namespace or assembly still
/// find their classes.
///
/// An Activator is an ordinary object (a JsonSerializer owns one). It takes
/// no lock: fill it at start, before other threads read it.
///
///   Activator activator;
///   activator.registerType<Generator>("");
///   activator.updateFullTypeNames("MyApp", "MyApp.Models");
///   auto model = activator.toInstance("MyApp.Models.Generator, MyApp");
class WAVEMILL_API Activator {
public:
  using Prototypes = std::unordered_map<std::string, std::shared_ptr<IModel>>;
  using Names = std::unordered_map<std::string, std::string>;

  /// Registers ApplicationBase, ApplicationManager and a collection of
  /// ApplicationBase, and gives the registered collections their
  /// descriptors.
  Activator();

  /// Registers the class `T` by its prototype; see registerModel.
  template <class T> void registerType(const std::string &name) { registerModel(Prototype::getInstance<T>(), name); }
  /// Makes `model`'s class known under its type name, its full type name
  /// and `name` (a collection also under its .NET name and the short form
  /// of that), and saves it as `name`, or by its full type name when `name`
  /// is empty. Throws std::out_of_range for a collection whose type name is
  /// shorter than five characters.
  void registerModel(std::shared_ptr<IModel> model, std::string name);
  /// The prototype known by `name`, else by its short name, else empty.
  /// An unknown name stays in the dictionary with an empty entry.
  std::shared_ptr<IModel> findPrototype(const std::string &name);
  /// A new model of the class known by `name` or by its short name; empty
  /// when neither is known.
  std::shared_ptr<IModel> toInstance(const std::string &name);
  /// The name `model`'s class is saved under.
  std::string toName(std::shared_ptr<IModel> model);
  /// The same as toName.
  std::string getFullTypeName(std::shared_ptr<IModel> model);
  /// "System.Collections.ObjectModel.Collection`1[[" + the item's saved
  /// name + "]], mscorlib".
  std::string makeDotNetFullTypeName(std::shared_ptr<ICollection> collection);
  /// The name without namespaces and assemblies, with "`1[[...]]" around
  /// each nested item name: "Ns.Foo, Asm" gives "Foo", a .NET collection of
  /// it "Collection`1[[Foo]]". Never throws; text it cannot read gives a
  /// shorter or empty result.
  static std::string makeShortTypeName(const std::string &name);
  /// Registers `model`'s class (a collection's item class first) under
  /// "Namespace.Type, Assembly" and returns that name.
  std::string updateFullTypeName(std::string assemblyName, std::string namespaceName, std::shared_ptr<IModel> model);
  /// Registers every class of the shared container under `namespaceName`
  /// and `assemblyName`: from then on each is saved under that name.
  void updateFullTypeNames(std::string assemblyName, std::string namespaceName);
  /// The shared container of load-time registered classes.
  std::shared_ptr<ModelContainer> getModelContainer() const { return modelContainer; }

private:
  static void getShortTypeNamePosition(const std::string &name, std::size_t start, std::size_t count,
                                       std::vector<std::tuple<std::size_t, std::size_t>> &positions);

  Prototypes prototypes;
  Names fullNameToTypeName;
  bool useRegisteredNames = true;
  std::shared_ptr<ModelContainer> modelContainer;
};

} // namespace Corvane::Wavemill
