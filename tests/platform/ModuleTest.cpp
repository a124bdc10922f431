#include "platform/Module.h"

#include <gtest/gtest.h>

#include <string>

using namespace Corvane::Wavemill;

// The program's path fits a buffer of its length and the terminating zero,
// and no smaller one; a refused query leaves the path alone.
TEST(ModuleTest, ProgramPathFitsOnlyWithRoomForTheTerminatingZero) {
  std::string program;
  ASSERT_EQ(Platform::processImagePath(-1, 32767, program), 0);
  ASSERT_EQ(program.front(), '/');
  std::string path;
  EXPECT_EQ(Platform::processImagePath(-1, program.size() + 1, path), 0);
  EXPECT_EQ(path, program);
  for (const std::size_t capacity : {program.size(), program.size() - 1, std::size_t(0)}) {
    std::string refused = "kept";
    EXPECT_EQ(Platform::processImagePath(-1, capacity, refused), Platform::insufficientBuffer) << capacity;
    EXPECT_EQ(refused, "kept");
  }
}
