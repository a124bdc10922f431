#pragma once

#include "wavemill/tools/Exceptions.h"

#include <gtest/gtest.h>

#include <string>
#include <type_traits>

namespace Corvane::Wavemill::Testing {

/// The message of the exception of type `E` that `action` throws:
/// getMessage() for the library's own exceptions, what() for the others.
/// A test failure and "" when `action` throws nothing or something else.
/// Example: EXPECT_EQ(thrownMessage<InstrumentException>([&] { s.writeLine("x"); }), "...").
template <class E, class F> std::string thrownMessage(F &&action) {
  try {
    action();
  } catch (const E &error) {
    if constexpr (std::is_base_of_v<ApplicationException, E>)
      return error.getMessage();
    else
      return error.what();
  } catch (...) {
    ADD_FAILURE() << "an exception of another type was thrown";
    return {};
  }
  ADD_FAILURE() << "nothing was thrown";
  return {};
}

/// Which of the library's two instrument-layer exceptions `action` throws,
/// with its message: "InstrumentException: text", "ApplicationException:
/// text" for an ApplicationException that is no InstrumentException, or
/// "nothing". Other exceptions pass through.
template <class F> std::string thrownLibraryException(F &&action) {
  try {
    action();
  } catch (const InstrumentException &error) {
    return "InstrumentException: " + error.getMessage();
  } catch (const ApplicationException &error) {
    return "ApplicationException: " + error.getMessage();
  }
  return "nothing";
}

} // namespace Corvane::Wavemill::Testing
