#include "wavemill/models/ModelBase.h"

#include "wavemill/models/Couplings.h"
#include "wavemill/models/ICollection.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/Setting.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/models/SubSetting.h"
#include "wavemill/services/LogBase.h"

#include <vector>

namespace Corvane::Wavemill {

// The flag words are part of saved documents and of applications' code.
static_assert(static_cast<std::uint32_t>(SubSetting<ModelBase>::SubBits) == 0xF0);

const std::string ModelBase::MissingSettings_key = "MissingSettings";
const std::string ModelBase::SettingMap_key = "SettingMap";

namespace {

// A plain character constant, so that models built by load-time registration in
// other translation units never meet an unconstructed string.
constexpr const char *settingMapKey = "SettingMap";

// Returns a non-owning shared pointer, for handing `this` to operations that
// take shared pointers without claiming ownership.
template <class T> std::shared_ptr<T> unowned(T *object) { return std::shared_ptr<T>(std::shared_ptr<void>(), object); }

} // namespace

std::string makeFullKeyWithCardinality() { return {}; }

ModelBase::ModelBase() : ModelBase(std::string()) {}

ModelBase::ModelBase(const std::string &typeName)
    : typeName(typeName), context(std::make_shared<ContextSetting>("Context")) {
  settings.reserve(8); // room for a usual model's settings without regrowing
  settings.push_back(context);
}

ModelBase::~ModelBase() { deactivateSettings(); }

std::shared_ptr<Setting> ModelBase::getSetting(const std::string &name) {
  auto map = makeSettingMap(unowned(this));
  auto found = map->find(name);
  if (found == map->end() || found->second >= settings.size())
    return nullptr;
  return settings[found->second];
}

IModel *ModelBase::ancestor(const std::string &wanted) {
  IModel *node = this;
  int count = 0;
  while (true) {
    if (node->getTypeName() == wanted)
      return node;
    IModel *next = node->getOwner();
    if (count++ >= 50) {
      LogBase::get("Log")->write(3, "There may be a loop or deep node in models.");
      return this;
    }
    if (next == nullptr)
      return this;
    node = next;
  }
}

std::shared_ptr<ModelBase::SettingMap> ModelBase::makeSettingMap(const std::shared_ptr<ModelBase> &model) {
  auto proto = model->getPrototype();
  Metadata &home = proto ? proto->getMetadata() : model->getMetadata();
  if (auto cached = home.get<SettingMap>(settingMapKey))
    return cached;
  auto map = std::make_shared<SettingMap>();
  const Settings &list = model->settings;
  for (std::size_t i = 0; i < list.size(); ++i) {
    const auto &setting = list[i];
    if (!setting)
      continue;
    map->emplace(setting->getName(), i);
    if (!setting->isSubSetting())
      continue;
    // Fill the caches of the nested classes at once.
    if (auto sub = std::dynamic_pointer_cast<ModelBase>(setting->getCommonValue()))
      makeSettingMap(sub);
    if (auto collection = std::dynamic_pointer_cast<ICollection>(setting->getCommonValue()))
      for (int j = 0; j < collection->getCount(); ++j)
        if (auto item = std::dynamic_pointer_cast<ModelBase>(collection->getCommonItem(j)))
          makeSettingMap(item);
  }
  home.set<SettingMap>(settingMapKey, map);
  return map;
}

bool ModelBase::canBeginEdit() const { return interceptor != nullptr && !interceptor->isInside(); }

std::shared_ptr<Transaction> ModelBase::beginEdit(TransactionOption option) {
  if (!canBeginEdit())
    return Transaction::empty();
  return std::make_shared<SyncTransaction>(interceptor, context.get(), option);
}

std::shared_ptr<Transaction> ModelBase::doBeginEdit(const std::string &methodName) {
  if (!canBeginEdit())
    return Transaction::empty();
  return std::make_shared<SyncTransaction>(interceptor, context.get(), methodName, nullptr);
}

// An inactive or nested model gets the shared empty transaction, whose option
// must stay NoCouple for every other caller.
std::shared_ptr<Transaction> ModelBase::beginRecall() {
  auto transaction = doBeginEdit("Recall");
  if (transaction->getInterceptor() != nullptr)
    transaction->setOption(TransactionOption::Recall);
  return transaction;
}

std::shared_ptr<Transaction> ModelBase::beginReset() {
  auto transaction = doBeginEdit("Reset");
  if (transaction->getInterceptor() != nullptr)
    transaction->setOption(TransactionOption::Reset);
  return transaction;
}

std::shared_ptr<Setting> ModelBase::makeArgument(const std::string &value) {
  return std::make_shared<StringSetting>("", value.c_str());
}

std::shared_ptr<Setting> ModelBase::makeArgument(const char *value) {
  return std::make_shared<StringSetting>("", value);
}

std::shared_ptr<Setting> ModelBase::makeArgument(int value) {
  auto setting = std::make_shared<Int32Setting>("");
  setting->setValue(value);
  return setting;
}

std::string ModelBase::toString() const { return getTypeName(); }

std::string ModelBase::getTypeName() const {
  const auto colon = typeName.rfind(':');
  return colon == std::string::npos ? typeName : typeName.substr(colon + 1);
}

std::string ModelBase::getFullTypeName() const {
  // One name for every class that keeps this form, filled by the first
  // caller; classes with their own full name override this member.
  static const std::string fullName = "Models." + getTypeName();
  return fullName;
}

bool ModelBase::isCollection() const { return false; }
std::shared_ptr<IModel> ModelBase::getItemPrototype() const { return nullptr; }
std::shared_ptr<IModel> ModelBase::create() const { return std::make_shared<ModelBase>(typeName); }
std::shared_ptr<IModel> ModelBase::getPrototype() const { return Prototype::getInstance<ModelBase>(); }
Metadata &ModelBase::getMetadata() { return metadata; }
std::string ModelBase::getThisKey() const { return owner != nullptr ? thisKey : std::string(); }
void ModelBase::setThisKey(const std::string &key) { thisKey = key; }

void ModelBase::activateSettings(Interceptor *tree, IModel *parent) {
  if (tree == nullptr)
    return;
  initialize();
  setOwner(parent);
  interceptor = tree;
  // An activation may append settings; the size is read anew each round.
  for (std::size_t i = 0; i < settings.size(); ++i)
    if (settings[i])
      settings[i]->activate(tree, this);
}

void ModelBase::deactivateSettings() {
  if (interceptor == nullptr)
    return;
  for (auto &setting : settings) {
    if (setting)
      setting->deactivate();
    setting.reset();
  }
  settings.clear();
  setOwner(nullptr);
  interceptor = nullptr;
  setThisKey("");
}

void ModelBase::onPropertyChanged(ISetting *) {}
IModel *ModelBase::getOwner() const { return owner; }
void ModelBase::setOwner(IModel *model) { owner = model; }

void ModelBase::reset() {
  auto transaction = beginReset();
  for (std::size_t i = 0; i < settings.size(); ++i)
    if (settings[i])
      settings[i]->reset();
}

bool ModelBase::copyFrom(const std::shared_ptr<IModel> &source) {
  if (!source || source.get() == this)
    return false;
  auto *other = dynamic_cast<ModelBase *>(source.get());
  if (other == nullptr || other->getPrototype() != getPrototype())
    return false;
  auto transaction = beginEdit(TransactionOption::Couple);
  for (std::size_t i = 0; i < settings.size() && i < other->settings.size(); ++i)
    if (settings[i])
      settings[i]->copyFrom(other->settings[i]);
  return true;
}

std::shared_ptr<IModel> ModelBase::duplicate() const {
  auto copy = create();
  copy->copyFrom(unowned(const_cast<ModelBase *>(this)));
  return copy;
}

void ModelBase::setCouplings(std::shared_ptr<ICouplings> value) { couplings = std::move(value); }
std::shared_ptr<ICouplings> ModelBase::getCouplings() const { return couplings; }

bool ModelBase::equals(const std::shared_ptr<IObject> &other) const {
  if (!other)
    return false;
  if (other.get() == this)
    return true;
  auto *model = dynamic_cast<const ModelBase *>(other.get());
  if (model == nullptr || model->getPrototype() != getPrototype())
    return false;
  if (model->settings.size() != settings.size())
    return false;
  for (std::size_t i = 0; i < settings.size(); ++i) {
    const auto &mine = settings[i];
    if (!mine || !mine->equals(model->settings[i]))
      return false;
  }
  return true;
}

std::string ModelBase::makePath() const {
  std::vector<std::string> keys;
  for (const IModel *node = this; node != nullptr; node = node->getOwner())
    keys.push_back(node->getThisKey());
  std::string path;
  for (auto key = keys.rbegin(); key != keys.rend(); ++key) {
    path += *key;
    if (key + 1 != keys.rend() && !path.empty())
      path += ',';
  }
  return path;
}

void ModelBase::initialize() {}
void ModelBase::onDeserialized() {}

void ModelBase::couple(Transaction *transaction) {
  if (couplings) {
    couplings->couple(this, transaction);
    return;
  }
  auto proto = getPrototype();
  if (proto.get() == static_cast<const IModel *>(this))
    return;
  if (auto shared = proto->getCouplings())
    shared->couple(this, transaction);
}

void ModelBase::setTypeName(std::string name) { typeName = std::move(name); }

} // namespace Corvane::Wavemill
