#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/StringSetting.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// The base of each application's top model. Its three settings are
/// run-time state, neither saved nor reset:
/// - `Selected`: selection among the applications of the manager is
///   exclusive, and a lone application is always selected;
/// - `Dirty`: set by any change of a plain setting anywhere in the tree,
///   cleared when a reset or a recall of a model ends;
/// - `Name`: the display name.
///
/// A derived application that wants couplings of its own overrides
/// couple() and calls ApplicationBase::couple from it.
class WAVEMILL_API ApplicationBase : public ModelBase {
public:
  ApplicationBase();
  explicit ApplicationBase(const std::string &typeName);
  ~ApplicationBase() override;

  std::string getTypeName() const override;
  std::string getFullTypeName() const override;
  std::shared_ptr<IModel> create() const override;
  std::shared_ptr<IModel> getPrototype() const override;

  /// Keeps selection exclusive when this application's `Selected` became
  /// true, then sets `Dirty` for a change of a setting, or clears it when a
  /// reset or a recall of a model ends. Runs for every change of the tree.
  void couple(Transaction *transaction) override;

  /// "Selected": true for the application the user works with.
  const std::shared_ptr<BoolSetting> Selected;
  /// "Dirty": true after a change that has not been saved or recalled.
  const std::shared_ptr<BoolSetting> Dirty;
  /// "Name": the display name.
  const std::shared_ptr<StringSetting> Name;
};

} // namespace Corvane::Wavemill
