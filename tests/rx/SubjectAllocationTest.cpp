#include "wavemill/rx/Subject.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <new>
#include <string>

// The global allocation functions of this test program are replaced by ones
// that behave like the usual ones and count, on the thread that asks for it,
// how often memory was requested. Every form that pairs with a replaced one
// is replaced too, so that no memory crosses from one allocator to another.
namespace {

thread_local bool counting = false;
thread_local long allocations = 0;

void *allocate(std::size_t size) {
  allocations += counting;
  return std::malloc(size == 0 ? 1 : size);
}

void *allocateOrThrow(std::size_t size) {
  if (void *memory = allocate(size))
    return memory;
  throw std::bad_alloc();
}

// Counts the allocations made by `work` on this thread.
template <class Work> long allocationsOf(Work &&work) {
  allocations = 0;
  counting = true;
  work();
  counting = false;
  return allocations;
}

} // namespace

void *operator new(std::size_t size) { return allocateOrThrow(size); }
void *operator new[](std::size_t size) { return allocateOrThrow(size); }
void *operator new(std::size_t size, const std::nothrow_t &) noexcept { return allocate(size); }
void *operator new[](std::size_t size, const std::nothrow_t &) noexcept { return allocate(size); }
void operator delete(void *memory) noexcept { std::free(memory); }
void operator delete[](void *memory) noexcept { std::free(memory); }
void operator delete(void *memory, std::size_t) noexcept { std::free(memory); }
void operator delete[](void *memory, std::size_t) noexcept { std::free(memory); }
void operator delete(void *memory, const std::nothrow_t &) noexcept { std::free(memory); }
void operator delete[](void *memory, const std::nothrow_t &) noexcept { std::free(memory); }

TEST(SubjectTest, OnNextAllocatesNothing) {
  Corvane::Wavemill::rx::subjects::subject<std::string> subject;
  const auto subscriber = subject.get_subscriber();
  const std::string value(100, 'x');                               // longer than any small-string buffer
  EXPECT_EQ(allocationsOf([&] { subscriber.on_next(value); }), 0); // nobody listens

  std::size_t received = 0;
  std::vector<Corvane::Wavemill::rx::subscription> subscriptions(5);
  for (auto &each : subscriptions)
    each = subject.get_observable().subscribe([&](const std::string &text) { received += text.size(); });
  subscriptions[2].unsubscribe();
  EXPECT_EQ(allocationsOf([&] {
              for (int i = 0; i < 100; ++i)
                subscriber.on_next(value);
            }),
            0);
  EXPECT_EQ(received, 4u * 100u * value.size());

  // The probe itself must see allocations, or the zeros above prove nothing.
  EXPECT_GT(allocationsOf([&] { subject.get_observable().subscribe([](const std::string &) {}); }), 0);
}
