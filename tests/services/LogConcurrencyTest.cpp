#include "wavemill/services/Log.h"

#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

struct LateChannel : Log {
  LateChannel() : Log("Late") {}
};

} // namespace

// Writers log through the shared channel, through named channels and with
// time stamps switched on and off, while other threads subscribe and
// unsubscribe and a module registers a channel of its own. Every record an
// observer receives is whole.
TEST(LogConcurrencyTest, WritersSubscribersAndLateChannelsShareTheTable) {
  constexpr int writers = 3;
  constexpr int lines = 300;
  auto channel = LogBase::get("Log");
  auto torn = std::make_shared<std::atomic<int>>(0);
  std::atomic<bool> writing{true};
  // Shared mode (the default) sends every channel's text through "Log".
  ASSERT_TRUE(Log::getShared());
  std::atomic<int> delivered{0};
  auto steady = channel->getSubject().get_observable().subscribe([&](LogMessage *) { ++delivered; });

  std::vector<std::thread> threads;
  for (int w = 0; w < writers; ++w)
    threads.emplace_back([w] {
      const std::string text = "writer " + std::to_string(w);
      for (int i = 0; i < lines; ++i) {
        Log::writeLogText(i % 2 ? "Log" : "Late", 2, text);
        LogBase::get("Log")->write(3, text);
        LogBase::get("Log")->setTimeStamp(i % 3 == 0);
      }
    });
  threads.emplace_back([] { const LogBase::Creator<LateChannel> lateCreator; });
  for (int s = 0; s < 2; ++s)
    threads.emplace_back([&] {
      while (writing.load()) {
        // A delivery may still be running when unsubscribe returns, so the
        // callback owns what it touches.
        auto subscription = channel->getSubject().get_observable().subscribe([torn](LogMessage *message) {
          const std::string line = message->toString();
          if (line.rfind("[", 0) != 0 || line.find("writer ") == std::string::npos)
            ++*torn;
        });
        std::this_thread::yield();
        subscription.unsubscribe();
      }
    });
  for (int w = 0; w < writers; ++w)
    threads[w].join();
  writing = false;
  for (std::size_t t = writers; t < threads.size(); ++t)
    threads[t].join();
  LogBase::get("Log")->setTimeStamp(false);

  steady.unsubscribe();
  EXPECT_EQ(delivered.load(), writers * lines * 2);
  EXPECT_EQ(torn->load(), 0);
  EXPECT_NE(std::dynamic_pointer_cast<LateChannel>(LogBase::get("Late")), nullptr);
}
