#pragma once

#include "wavemill/Export.h"

#include <functional>

namespace Corvane::Wavemill {

/// Runs a function when the scope that holds the guard ends, on every way
/// out: a return, the end of the block or an exception.
///
///     session.setTimeout(shortTimeout);
///     Finally restore([&] { session.setTimeout(oldTimeout); });
///
/// The destructor calls the function once and then destroys it, releasing
/// whatever it captured. The destructor lets no exception out: an empty
/// function, or one that throws, ends the process. A guard can be neither
/// copied nor moved, so its function cannot run twice or not at all.
class WAVEMILL_API Finally {
public:
  explicit Finally(std::function<void()> action);
  ~Finally();

  Finally(const Finally &) = delete;
  Finally &operator=(const Finally &) = delete;
  Finally(Finally &&) = delete;
  Finally &operator=(Finally &&) = delete;

private:
  std::function<void()> action;
};

} // namespace Corvane::Wavemill
