#include "wavemill/rx/Subject.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <thread>

// Two publishers send disjoint ranges of values while two other threads keep
// adding observers that end themselves from inside a delivery.
TEST(SubjectConcurrencyTest, SteadyObserverGetsEveryValueOnceWhileOthersComeAndGo) {
  constexpr int publishers = 2, perPublisher = 5000;
  Corvane::Wavemill::rx::subjects::subject<int> subject;
  std::vector<std::atomic<int>> hits(publishers * perPublisher);
  // A publisher's values reach the steady observer on that publisher's
  // thread, so each slot of `expected` and `outOfOrder` has one writer.
  std::vector<int> expected(publishers), outOfOrder(publishers);
  auto steady = subject.get_observable().subscribe([&](int value) {
    hits[value].fetch_add(1, std::memory_order_relaxed);
    const int p = value / perPublisher, offset = value % perPublisher;
    outOfOrder[p] += offset != expected[p];
    expected[p] = offset + 1;
  });

  std::atomic<bool> go{false};
  std::atomic<int> publishing{publishers};
  std::atomic<long> churnCalls{0};
  std::vector<std::thread> threads;
  for (int p = 0; p < publishers; ++p)
    threads.emplace_back([&, p] {
      while (!go.load())
        std::this_thread::yield();
      for (int i = 0; i < perPublisher; ++i)
        subject.get_subscriber().on_next(p * perPublisher + i);
      publishing.fetch_sub(1);
    });
  for (int c = 0; c < 2; ++c)
    threads.emplace_back([&] {
      while (!go.load())
        std::this_thread::yield();
      const auto observable = subject.get_observable();
      while (publishing.load() > 0) {
        // Ends itself, and on some values adds and ends another observer, on
        // a publisher's thread. Values may arrive before its handle is
        // stored, so the handle is guarded.
        struct Handle {
          std::mutex mutex;
          Corvane::Wavemill::rx::subscription subscription;
        };
        auto self = std::make_shared<Handle>();
        auto ending = observable.subscribe([&, self](int value) {
          churnCalls.fetch_add(1);
          if (value % 7 == 0)
            observable.subscribe([&](int) { churnCalls.fetch_add(1); }).unsubscribe();
          std::lock_guard<std::mutex> guard(self->mutex);
          self->subscription.unsubscribe();
        });
        {
          std::lock_guard<std::mutex> guard(self->mutex);
          self->subscription = ending;
        }
        std::this_thread::yield();
        ending.unsubscribe();
      }
    });
  go.store(true);
  for (auto &thread : threads)
    thread.join();

  for (int value = 0; value < publishers * perPublisher; ++value)
    ASSERT_EQ(hits[value].load(), 1) << "value " << value;
  EXPECT_EQ(outOfOrder, std::vector<int>(publishers, 0));
  // Every transient observer has ended: only the steady one is still called.
  const auto churned = churnCalls.load();
  subject.get_subscriber().on_next(0);
  EXPECT_EQ(churnCalls.load(), churned);
  EXPECT_EQ(hits[0].load(), 2);
  steady.unsubscribe();
  EXPECT_FALSE(subject.has_observers());
}
