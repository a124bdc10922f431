#include "wavemill/tools/Finally.h"

#include <gtest/gtest.h>

#include <functional>

using namespace Corvane::Wavemill;

TEST(FinallyTest, EmptyFunctionEndsTheProcess) {
  EXPECT_DEATH({ Finally guard{std::function<void()>()}; }, "");
}
