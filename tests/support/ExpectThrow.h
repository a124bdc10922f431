#pragma once

#include "wavemill/tools/Exceptions.h"

#include <stdexcept>
#include <string>

namespace Corvane::Wavemill::Testing {

/// What `action` throws, as "Type: message" in one comparable string: the
/// library's own exceptions with getMessage() ("InstrumentException: ...",
/// "ArgumentOutOfRangeException: ...", "ApplicationException: ..." for the
/// others), std::invalid_argument, std::out_of_range and other
/// std::runtime_errors with what(); "nothing" when nothing is thrown.
/// Example: EXPECT_EQ(thrown([&] { s.writeLine("x"); }), "InstrumentException: ...").
template <class F> std::string thrown(F &&action) {
  try {
    action();
  } catch (const InstrumentException &error) {
    return "InstrumentException: " + error.getMessage();
  } catch (const ArgumentOutOfRangeException &error) {
    return "ArgumentOutOfRangeException: " + error.getMessage();
  } catch (const ApplicationException &error) {
    return "ApplicationException: " + error.getMessage();
  } catch (const std::invalid_argument &error) {
    return std::string("invalid_argument: ") + error.what();
  } catch (const std::out_of_range &error) {
    return std::string("out_of_range: ") + error.what();
  } catch (const std::runtime_error &error) {
    return std::string("runtime_error: ") + error.what();
  }
  return "nothing";
}

} // namespace Corvane::Wavemill::Testing
