#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/StringSetting.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// One text in the tree, saved and recalled with everything else. Known to
/// documents from the moment the library is loaded.
class WAVEMILL_API TextModel : public ModelBase {
public:
  TextModel();
  ~TextModel() override;

  std::string getTypeName() const override;
  std::string getFullTypeName() const override;
  std::shared_ptr<IModel> create() const override;
  std::shared_ptr<IModel> getPrototype() const override;

  /// The text: "Text", empty by default.
  const std::shared_ptr<StringSetting> Text;
};

} // namespace Corvane::Wavemill
