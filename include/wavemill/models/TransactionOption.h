#pragma once

#include <cstdint>

namespace Corvane::Wavemill {

/// What a transaction does when it ends. Any value other than NoCouple
/// couples; only the application classes tell Reset and Recall apart.
enum class TransactionOption : std::int32_t {
  /// Ends without a coupling step.
  NoCouple = 0,
  /// A normal edit: couple at the end.
  Couple = 1,
  /// A reset of a model.
  Reset = 3,
  /// A recall of a model.
  Recall = 4,
};

/// How Transaction::propagate enters another tree.
enum class PropagationOption : std::int32_t {
  /// Open an edit of the other tree that does not couple.
  PropagateOnly = 0,
  /// Open an edit that does not couple, and couple the target model at once.
  PropagateAndCouple = 1,
  /// Open an edit of the other tree with the given transaction option.
  PropagateWithOption = 2,
};

} // namespace Corvane::Wavemill
