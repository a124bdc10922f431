#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ContextSetting.h"
#include "wavemill/models/IModel.h"
#include "wavemill/models/Metadata.h"
#include "wavemill/models/Transaction.h"

#include <cstdint>
#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

namespace Corvane::Wavemill {

class ICouplings;
class Setting;

/// The base of all models: a type name, a list of settings in a fixed
/// order (element 0 is always the "Context" setting), an owner and a key
/// that place the model in its tree, metadata and couplings.
///
/// Application classes create their settings in the constructor and
/// register them with init(), so that serialization, recall, comparison and
/// copying work on the list without code of their own. A model is
/// constructed inactive, becomes active with activateSettings() and is done
/// for good after deactivateSettings(), which the destructor calls.
class WAVEMILL_API ModelBase : public IModel {
public:
  /// Map from setting names to indices in the settings list, kept once per
  /// class on the prototype.
  using SettingMap = std::unordered_map<std::string, std::uint64_t>;
  using Settings = std::vector<std::shared_ptr<Setting>>;

  /// The metadata key of the list of stored settings a document lacked:
  /// "MissingSettings".
  static const std::string MissingSettings_key;
  /// The metadata key of a class's name map on its prototype: "SettingMap".
  static const std::string SettingMap_key;

  ModelBase();
  /// `typeName` may hold a namespace path with double colons.
  explicit ModelBase(const std::string &typeName);
  ~ModelBase() override;

  ModelBase(const ModelBase &) = delete;
  ModelBase &operator=(const ModelBase &) = delete;

  /// Appends `setting` to the settings list and hands it back, so that a
  /// constructor initialises a setting field in one expression.
  template <class T> std::shared_ptr<T> init(std::shared_ptr<T> setting) {
    settings.push_back(setting);
    return setting;
  }

  /// The settings in registration order, "Context" first.
  const Settings &getAllSettings() const { return settings; }
  /// The setting named `name` through the class's name map, or null.
  std::shared_ptr<Setting> getSetting(const std::string &name);
  /// The nearest model, starting with this one and walking up the owner
  /// chain, whose type name is `typeName`. On a miss, this model. The walk
  /// stops after 50 steps with a warning on the "Log" channel.
  IModel *ancestor(const std::string &typeName);
  /// The name map of `model`'s class, built from the first instance asked
  /// and kept in the prototype's metadata under "SettingMap".
  static std::shared_ptr<SettingMap> makeSettingMap(const std::shared_ptr<ModelBase> &model);

  /// Begins an edit of this model's tree that couples at its end with
  /// `option`. Returns the shared empty transaction when the model is
  /// inactive or the calling thread is already inside the tree; otherwise a
  /// SyncTransaction on "Context" that holds the lock until it is dropped.
  std::shared_ptr<Transaction> beginEdit(TransactionOption option = TransactionOption::Couple);
  /// Like beginEdit, as a method transaction named `methodName`.
  std::shared_ptr<Transaction> doBeginEdit(const std::string &methodName);
  /// A method transaction whose arguments, in the order given, are wrapped
  /// in temporary settings: a string in a StringSetting, an int in an
  /// Int32Setting, a model pointer in a SubSetting.
  template <class First, class... Rest>
  std::shared_ptr<Transaction> beginEdit(const std::string &methodName, First &&first, Rest &&...rest) {
    if (!canBeginEdit())
      return Transaction::empty();
    auto arguments = std::make_shared<SyncTransaction::Arguments>();
    arguments->reserve(1 + sizeof...(Rest));
    arguments->push_back(makeArgument(std::forward<First>(first)));
    (arguments->push_back(makeArgument(std::forward<Rest>(rest))), ...);
    return std::make_shared<SyncTransaction>(interceptor, context.get(), methodName, std::move(arguments));
  }
  /// The transaction under which an application fills this tree from a
  /// document: method "Recall", option Recall.
  std::shared_ptr<Transaction> beginRecall();
  /// The transaction of a reset: method "Reset", option Reset.
  std::shared_ptr<Transaction> beginReset();

  static std::shared_ptr<Setting> makeArgument(const std::string &value);
  static std::shared_ptr<Setting> makeArgument(const char *value);
  static std::shared_ptr<Setting> makeArgument(int value);
  /// Defined with the sub-model holder; include "wavemill/models/SubSetting.h".
  template <class M> static std::shared_ptr<Setting> makeArgument(const std::shared_ptr<M> &model);

  // IModel
  std::string toString() const override;
  /// The stored type name reduced to what follows its last colon.
  std::string getTypeName() const override;
  /// "Models." + getTypeName(), computed once for all classes that do not
  /// override it: a concrete class overrides both names.
  std::string getFullTypeName() const override;
  bool isCollection() const override;
  std::shared_ptr<IModel> getItemPrototype() const override;
  std::shared_ptr<IModel> create() const override;
  std::shared_ptr<IModel> getPrototype() const override;
  Metadata &getMetadata() override;
  /// The stored key while the model has an owner; otherwise empty.
  std::string getThisKey() const override;
  void setThisKey(const std::string &key) override;
  void activateSettings(Interceptor *interceptor, IModel *owner) override;
  void deactivateSettings() override;
  void onPropertyChanged(ISetting *setting) override;
  IModel *getOwner() const override;
  void setOwner(IModel *model) override;
  void reset() override;
  bool copyFrom(const std::shared_ptr<IModel> &source) override;
  std::shared_ptr<IModel> duplicate() const override;
  void setCouplings(std::shared_ptr<ICouplings> value) override;
  std::shared_ptr<ICouplings> getCouplings() const override;
  /// True for a model of the same class whose settings equal this model's,
  /// position by position.
  bool equals(const std::shared_ptr<IObject> &other) const override;

  /// The keys from the first child of the root down to this model, joined
  /// by commas, such as "Applications,0,Name".
  virtual std::string makePath() const;
  /// Runs at the start of each activation.
  virtual void initialize();
  /// Runs after the model was read from a document.
  virtual void onDeserialized();
  /// Runs this model's couplings, or else those of its class's prototype.
  /// Does not descend into sub-models.
  virtual void couple(Transaction *transaction);

  /// The Interceptor of the tree, null while inactive.
  Interceptor *getInterceptor() const { return interceptor; }
  /// The "Context" setting that stands for the model in transactions.
  const std::shared_ptr<ContextSetting> &getContext() const { return context; }

protected:
  virtual void setTypeName(std::string name);

  /// True when beginEdit would open a real transaction.
  bool canBeginEdit() const;

  IModel *owner = nullptr;
  Interceptor *interceptor = nullptr;
  std::string typeName;
  std::string thisKey;
  Metadata metadata;
  std::shared_ptr<ContextSetting> context;
  Settings settings;
  std::shared_ptr<ICouplings> couplings;
};

/// The key of a model's cardinality; empty in this library.
WAVEMILL_API std::string makeFullKeyWithCardinality();

} // namespace Corvane::Wavemill

#include "wavemill/models/Prototype.h"
#include "wavemill/models/RunTime.h"

/// Inside the body of a model class `Class` (default-constructible, derived
/// from ModelBase or one of its subclasses): the members every concrete
/// model class overrides, namely its short and full type name (from the
/// compiler's text of the class's own members, computed once), create() and
/// getPrototype().
///
///   class Generator : public ApplicationBase {
///   public:
///     WAVEMILL_MODEL(Generator)
///     Generator() : ApplicationBase("MyApp::Generator") {}
///   };
#define WAVEMILL_MODEL(Class)                                                                                          \
  std::string getTypeName() const override { return WAVEMILL_TYPE_NAME(); }                                            \
  std::string getFullTypeName() const override { return WAVEMILL_FULL_TYPE_NAME(); }                                   \
  std::shared_ptr<::Corvane::Wavemill::IModel> create() const override { return std::make_shared<Class>(); }           \
  std::shared_ptr<::Corvane::Wavemill::IModel> getPrototype() const override {                                         \
    return ::Corvane::Wavemill::Prototype::getInstance<Class>();                                                       \
  }
