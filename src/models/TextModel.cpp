#include "wavemill/models/TextModel.h"

#include "wavemill/models/ModelContainer.h"
#include "wavemill/models/Prototype.h"
#include "wavemill/models/RunTime.h"

namespace Corvane::Wavemill {

TextModel::TextModel() : ModelBase("TextModel"), Text(init(std::make_shared<StringSetting>("Text"))) {}
TextModel::~TextModel() = default;

std::string TextModel::getTypeName() const { return WAVEMILL_TYPE_NAME(); }
std::string TextModel::getFullTypeName() const { return WAVEMILL_FULL_TYPE_NAME(); }
std::shared_ptr<IModel> TextModel::create() const { return std::make_shared<TextModel>(); }
std::shared_ptr<IModel> TextModel::getPrototype() const { return Prototype::getInstance<TextModel>(); }

} // namespace Corvane::Wavemill

// Documents know TextModel as soon as the library is loaded.
WAVEMILL_REGISTER_MODEL(Corvane::Wavemill::TextModel)
