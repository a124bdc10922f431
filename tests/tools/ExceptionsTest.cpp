#include "wavemill/tools/Exceptions.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>

using namespace Corvane::Wavemill;

namespace {

// Throws `thrown` and reports what a handler of the root type reads.
template <class E> std::pair<std::string, std::string> caught(const E &thrown) {
  try {
    throw thrown;
  } catch (const ApplicationException &e) {
    return {e.what(), e.getMessage()};
  }
}

} // namespace

TEST(ExceptionsTest, WhatIsFixedPerFamilyAndTheMessageComesOnlyFromGetMessage) {
  using Result = std::pair<std::string, std::string>;
  EXPECT_EQ(caught(ApplicationException("no file")), Result("Application Exception", "no file"));
  EXPECT_EQ(caught(InstrumentException("timeout")), Result("Application Exception", "timeout"));
  EXPECT_EQ(caught(ArgumentException("name")), Result("Argumen Exception", "name"));
  EXPECT_EQ(caught(ArgumentOutOfRangeException("index 5")), Result("Argumen Exception", "index 5"));
  EXPECT_THROW(throw ArgumentOutOfRangeException("index 7"), ArgumentException);
}
