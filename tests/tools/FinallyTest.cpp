#include "wavemill/tools/Finally.h"

#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>

using namespace Corvane::Wavemill;

TEST(FinallyTest, RunsOnceOnEveryWayOutAndReleasesWhatItCaptured) {
  int runs = 0;
  const auto captured = std::make_shared<int>(0);
  {
    Finally guard([&runs, captured] { ++runs; });
    EXPECT_EQ(runs, 0);
    EXPECT_EQ(captured.use_count(), 2);
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
