#include "wavemill/tools/Exceptions.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>

using namespace Corvane::Wavemill;

namespace {

// Throws `thrown` and reports what a handler of the root type reads.
template <class E> std::pair<std::string, std::string> catchAsApplicationException(const E &thrown) {
  try {
    throw thrown;
  } catch (const ApplicationException &caught) {
    return {caught.what(), caught.getMessage()};
  }
}

} // namespace

TEST(ExceptionsTest, WhatIsFixedPerFamilyAndTheMessageComesOnlyFromGetMessage) {
  using Result = std::pair<std::string, std::string>;
  EXPECT_EQ(catchAsApplicationException(ApplicationException("no file")), Result("Application Exception", "no file"));
  EXPECT_EQ(catchAsApplicationException(InstrumentException("timeout")), Result("Application Exception", "timeout"));
  EXPECT_EQ(catchAsApplicationException(ArgumentException("name")), Result("Argumen Exception", "name"));
  EXPECT_EQ(catchAsApplicationException(ArgumentOutOfRangeException("index 5")),
            Result("Argumen Exception", "index 5"));
  EXPECT_THROW(throw ArgumentOutOfRangeException("index 7"), ArgumentException);
  EXPECT_THROW(throw InstrumentException("lost"), std::exception);
}
