#include "wavemill/models/TextPair.h"

#include "wavemill/models/Prototype.h"
#include "wavemill/models/RunTime.h"

namespace Corvane::Wavemill {

TextPair::TextPair()
    : ModelBase("TextPair"), Key(init(std::make_shared<StringSetting>("Key"))),
      Value(init(std::make_shared<StringSetting>("Value"))) {}

TextPair::TextPair(const std::string &key, const std::string &value) : TextPair() {
  Key->setValue(key);
  Value->setValue(value);
}

TextPair::~TextPair() = default;

std::string TextPair::getTypeName() const { return WAVEMILL_TYPE_NAME(); }
std::string TextPair::getFullTypeName() const { return WAVEMILL_FULL_TYPE_NAME(); }
std::shared_ptr<IModel> TextPair::create() const { return std::make_shared<TextPair>(); }
std::shared_ptr<IModel> TextPair::getPrototype() const { return Prototype::getInstance<TextPair>(); }

} // namespace Corvane::Wavemill
