#include "platform/Network.h"

#include <gtest/gtest.h>

#include <thread>
#include <vector>

using namespace Corvane::Wavemill;

// This copy of the platform layer counts for this test alone; the library's
// own count is out of its reach.
TEST(NetworkTest, StartsAndStopsOfTheSocketLibraryPairUpAcrossThreads) {
  const int before = Platform::socketUsers();
  const auto onThreads = [](auto operation) {
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t)
      threads.emplace_back([operation] {
        for (int i = 0; i < 10000; ++i)
          operation();
      });
    for (auto &thread : threads)
      thread.join();
  };
  onThreads([] { EXPECT_TRUE(Platform::startSockets()); });
  EXPECT_EQ(Platform::socketUsers(), before + 40000); // no start lost to a race
  onThreads([] { Platform::stopSockets(); });
  EXPECT_EQ(Platform::socketUsers(), before);
}
