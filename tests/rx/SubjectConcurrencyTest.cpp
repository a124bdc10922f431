#include "wavemill/rx/Subject.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

TEST(SubjectConcurrencyTest, SteadyObserverGetsEveryValueOnceWhileOthersComeAndGo) {
  constexpr int publisherCount = 2;
  constexpr int valuesPerPublisher = 5000;
  constexpr int churnerCount = 2;

  rxcpp::subjects::subject<int> subject;
  std::vector<std::atomic<int>> hits(publisherCount * valuesPerPublisher);
  // Each publisher's values reach the steady observer on that publisher's
  // thread, so each slot is written by one thread only.
  std::vector<int> expectedNext(publisherCount);
  std::vector<int> outOfOrder(publisherCount);
  for (int p = 0; p < publisherCount; ++p)
    expectedNext[p] = p * valuesPerPublisher;
  auto steady = subject.get_observable().subscribe([&](int value) {
    hits[value].fetch_add(1, std::memory_order_relaxed);
    const int p = value / valuesPerPublisher;
    if (value != expectedNext[p])
      ++outOfOrder[p];
    expectedNext[p] = value + 1;
  });

  std::atomic<bool> go{false};
  std::atomic<int> publishing{publisherCount};
  std::atomic<long> churnCalls{0};
  std::vector<std::thread> threads;
  for (int p = 0; p < publisherCount; ++p)
    threads.emplace_back([&, p] {
      while (!go.load())
        std::this_thread::yield();
      const auto subscriber = subject.get_subscriber();
      for (int i = 0; i < valuesPerPublisher; ++i)
        subscriber.on_next(p * valuesPerPublisher + i);
      publishing.fetch_sub(1);
    });
  for (int c = 0; c < churnerCount; ++c)
    threads.emplace_back([&] {
      while (!go.load())
        std::this_thread::yield();
      const auto observable = subject.get_observable();
      while (publishing.load() > 0) {
        auto plain = observable.subscribe([&](int) { churnCalls.fetch_add(1); });
        // This one ends itself, and on some values adds and ends another
        // observer, from inside a delivery on a publisher's thread. Values may
        // arrive before its handle is stored, so the handle is guarded.
        struct Handle {
          std::mutex mutex;
          rxcpp::subscription subscription;
        };
        auto self = std::make_shared<Handle>();
        auto ending = observable.subscribe([&, self](int value) {
          churnCalls.fetch_add(1);
          if (value % 7 == 0)
            observable.subscribe([&](int) { churnCalls.fetch_add(1); }).unsubscribe();
          rxcpp::subscription handle;
          {
            std::lock_guard<std::mutex> guard(self->mutex);
            handle = self->subscription;
          }
          handle.unsubscribe();
        });
        {
          std::lock_guard<std::mutex> guard(self->mutex);
          self->subscription = ending;
        }
        std::this_thread::yield();
        plain.unsubscribe();
        ending.unsubscribe();
      }
    });
  go.store(true);
  for (auto &thread : threads)
    thread.join();

  for (int value = 0; value < publisherCount * valuesPerPublisher; ++value)
    ASSERT_EQ(hits[value].load(), 1) << "value " << value;
  for (int p = 0; p < publisherCount; ++p)
    EXPECT_EQ(outOfOrder[p], 0) << "publisher " << p;

  // Every transient observer has ended: only the steady one is still called.
  const auto churned = churnCalls.load();
  subject.get_subscriber().on_next(0);
  EXPECT_EQ(churnCalls.load(), churned);
  EXPECT_EQ(hits[0].load(), 2);
  steady.unsubscribe();
  EXPECT_FALSE(subject.has_observers());
}
