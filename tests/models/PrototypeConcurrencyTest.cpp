#include "wavemill/models/Prototype.h"

#include <gtest/gtest.h>

#include <array>
#include <atomic>
#include <thread>
#include <utility>

using Corvane::Wavemill::Prototype;

namespace {

template <int Tag> struct Counted {
  Counted() { made.fetch_add(1); }
  static inline std::atomic<int> made{0};
};
using Shared = Counted<-1>;
using Dependency = Counted<-2>;
struct Dependent {
  Dependent() { made.fetch_add(1); }
  std::shared_ptr<Dependency> dependency = Prototype::getInstance<Dependency>();
  static inline std::atomic<int> made{0};
};

constexpr int threadCount = 8;

template <std::size_t... Tags> auto ownClassGetters(std::index_sequence<Tags...>) {
  return std::array<std::shared_ptr<void> (*)(), sizeof...(Tags)>{
      +[]() -> std::shared_ptr<void> { return Prototype::getInstance<Counted<static_cast<int>(Tags)>>(); }...};
}

} // namespace

TEST(PrototypeConcurrencyTest, ThreadsReachingNewClassesAtOnceShareOneInstance) {
  // Every thread first reaches a class of its own, so that the shared map is
  // filled from several threads at the same time; half the threads then come
  // through the class that needs the other one.
  const auto reachOwnClass = ownClassGetters(std::make_index_sequence<threadCount>());
  std::atomic<bool> go{false};
  std::vector<std::shared_ptr<void>> own(threadCount), shared(threadCount), dependents(threadCount),
      dependencies(threadCount);
  std::vector<std::thread> threads;
  for (int i = 0; i < threadCount; ++i)
    threads.emplace_back([&, i] {
      while (!go.load())
        std::this_thread::yield();
      own[i] = reachOwnClass[i]();
      shared[i] = Prototype::getInstance<Shared>();
      if (i % 2 == 0)
        dependents[i] = Prototype::getInstance<Dependent>();
      dependencies[i] = Prototype::getInstance<Dependency>();
      dependents[i] = Prototype::getInstance<Dependent>();
    });
  go.store(true);
  for (auto &thread : threads)
    thread.join();

  ASSERT_NE(shared[0], nullptr);
  ASSERT_NE(dependents[0], nullptr);
  for (int i = 0; i < threadCount; ++i) {
    EXPECT_NE(own[i], nullptr);
    for (int j = 0; j < i; ++j)
      EXPECT_NE(own[i], own[j]);
    EXPECT_EQ(shared[i], shared[0]);
    EXPECT_EQ(dependents[i], dependents[0]);
    EXPECT_EQ(dependencies[i], dependencies[0]);
  }
  EXPECT_EQ(std::static_pointer_cast<Dependent>(dependents[0])->dependency, dependencies[0]);
  EXPECT_EQ(Shared::made.load(), 1);
  EXPECT_EQ(Dependent::made.load(), 1);
  EXPECT_EQ(Dependency::made.load(), 1);
}
