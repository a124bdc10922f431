#pragma once

#include "wavemill/Export.h"
#include "wavemill/json/JToken.h"
#include "wavemill/models/Activator.h"
#include "wavemill/models/ICollection.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/Setting.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// The options of a JsonSerializer.
class WAVEMILL_API JsonSerializerSetting {
public:
  JsonSerializerSetting() = default;

  /// In tree mode a model writes only the plain settings marked TreeStored
  /// (sub-models always), and reading walks the document's members instead
  /// of the model's settings.
  bool getTreeMode() const { return treeMode; }
  void setTreeMode(bool on) { treeMode = on; }
  /// With tracking, reading lists the stored settings a document lacks in
  /// the model's metadata under ModelBase::MissingSettings_key.
  bool getDeserializationTracking() const { return deserializationTracking; }
  void setDeserializationTracking(bool on) { deserializationTracking = on; }

private:
  bool treeMode = false;
  bool deserializationTracking = false;
};

/// Writes a model tree to a JSON document and restores a tree from one.
///
/// A model is an object whose first member "$type" names its class the
/// .NET way ("Namespace.Type, Assembly", see Activator), followed by one
/// member per persisted setting: a scalar for a plain setting, an object for
/// a sub-model. A collection is an object with "$type"
/// ("System.Collections.ObjectModel.Collection`1[[...]], mscorlib") and the
/// array "$values". Members stand in ascending byte order of their names.
///
/// Reading is forgiving: an unknown class gives an empty pointer where it
/// stands, a missing member leaves its setting as it is, and nothing is
/// thrown for a damaged document. Values go through each setting's parse(),
/// so an active tree sees its ordinary writes, validation and
/// notifications; fill a live tree under ModelBase::beginRecall().
///
/// A serializer works on the calling thread and owns its Activator;
/// deserialize() changes the Activator's maps, so serializers sharing one
/// must not run at the same time.
///
///   JsonSerializer serializer;
///   serializer.getActivator()->updateFullTypeNames("MyApp", "MyApp.Models");
///   std::string text = serializer.serialize(manager);
///   auto recalled = serializer.deserialize(text);
class WAVEMILL_API JsonSerializer {
public:
  /// Default options and a new Activator.
  JsonSerializer();
  /// `setting` is kept as it comes; an empty `activator` makes a new one.
  JsonSerializer(std::shared_ptr<JsonSerializerSetting> setting, std::shared_ptr<Activator> activator);
  virtual ~JsonSerializer();

  /// The document of `model`, written with indent 0; empty for an empty
  /// pointer.
  virtual std::string serialize(std::shared_ptr<ModelBase> model);
  /// A new tree from `text`, or an empty pointer when the root's class is
  /// unknown or the text holds no object. Every class registered with the
  /// shared ModelContainer so far is made known to the Activator first,
  /// which also resets their saved names to their full type names.
  virtual std::shared_ptr<ModelBase> deserialize(const std::string &text);
  /// The object of a model or a collection; empty for anything else.
  virtual std::shared_ptr<JObject> serializeObject(std::shared_ptr<IModel> model);
  /// A new model or collection of the object's class, filled from it; empty
  /// when the class is unknown.
  virtual std::shared_ptr<IModel> deserializeObject(std::shared_ptr<JObject> object);
  /// Fills `existing` in place when it is of the object's class, and says
  /// whether it was.
  virtual bool deserializeToExistObject(std::shared_ptr<JObject> object, std::shared_ptr<IModel> existing);

  std::shared_ptr<Activator> getActivator() const { return activator; }
  void setAcitvator(std::shared_ptr<Activator> value) { activator = std::move(value); }
  std::shared_ptr<JsonSerializerSetting> getSetting() const { return setting; }

  /// The object of `text`, read from its first "{"; never throws.
  static std::shared_ptr<JObject> parse(const std::string &text);

protected:
  virtual std::shared_ptr<JObject> doSerializeModel(std::shared_ptr<ModelBase> model);
  virtual std::shared_ptr<JObject> doSerializeCollection(std::shared_ptr<ICollection> collection);
  virtual void doDeserializeModel(std::shared_ptr<ModelBase> model, std::shared_ptr<JObject> object);
  virtual void doDeserializeCollection(std::shared_ptr<ICollection> collection, std::shared_ptr<JObject> object);
  /// Reads `token` into `setting`: a scalar through parse() for a plain
  /// setting, an object for a sub-model. A token of the wrong kind is
  /// ignored.
  virtual void updateSetting(std::shared_ptr<JToken> token, std::shared_ptr<Setting> setting);

  /// The class name of "$type" without its quotation marks, or false when
  /// the object has no such scalar.
  static bool readTypeName(const JObject &object, std::string &name);
  /// True for a setting written as a scalar (any of ParameterBits::ValueKinds).
  static bool isPlain(const Setting &setting) { return hasAny(setting.getParameterBits(), ParameterBits::ValueKinds); }
  /// True for a setting whose text is quoted (StringKind or EnumKind).
  static bool isQuoted(const Setting &setting) {
    return hasAny(setting.getParameterBits(), ParameterBits::QuotedKinds);
  }

private:
  std::shared_ptr<JsonSerializerSetting> setting;
  std::shared_ptr<Activator> activator;
};

} // namespace Corvane::Wavemill
