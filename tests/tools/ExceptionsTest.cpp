#include "wavemill/tools/Exceptions.h"
#include "wavemill/tools/Finally.h"

#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
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
  EXPECT_EQ(caught(ArgumentOutOfRangeException("index 5")), Result("Argumen Exception", "index 5"));
}

TEST(FinallyTest, RunsOnceOnEveryWayOutAndReleasesWhatItCaptured) {
  int runs = 0;
  const auto captured = std::make_shared<int>(0);
  {
    Finally guard([&runs, captured] { ++runs; });
    EXPECT_EQ(runs, 0);
  }
  EXPECT_EQ(runs, 1);
  EXPECT_EQ(captured.use_count(), 1);
  try {
    Finally guard([&runs] { ++runs; });
    throw std::runtime_error("leave early");
  } catch (const std::runtime_error &) {
  }
  EXPECT_EQ(runs, 2);
}

TEST(FinallyTest, EmptyFunctionEndsTheProcess) {
  EXPECT_DEATH({ Finally guard{std::function<void()>()}; }, "");
}
