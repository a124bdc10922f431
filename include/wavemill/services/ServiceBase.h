#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IService.h"

#include <string>

namespace Corvane::Wavemill {

/// The plain service, a base for helpers that need no life cycle of their
/// own. setup() does nothing; start(), stop() and isRunning() answer true and
/// keep no state, so a plain service always counts as running. A derived
/// class overrides what it needs. Stateless, so safe from any thread.
class WAVEMILL_API ServiceBase : public IService {
public:
  ~ServiceBase() override;

  /// Does nothing.
  void setup() override;
  /// Always true.
  bool start() override;
  /// Always true; the service still counts as running afterwards.
  bool stop() override;
  /// Always true.
  bool isRunning() const override;
  /// "ServiceBase".
  std::string toString() const override;
};

} // namespace Corvane::Wavemill
