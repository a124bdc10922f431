#include "wavemill/models/Prototype.h"

#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>

using Corvane::Wavemill::Prototype;

namespace {

// Each class counts how often it was made, so that a second instance shows.
template <int Tag> struct Counted {
  Counted() { ++made; }
  static inline int made = 0;
  int value = Tag;
};

struct Inner {
  Inner() { ++made; }
  static inline int made = 0;
};

struct Middle {
  Middle() : inner(Prototype::getInstance<Inner>()) {}
  std::shared_ptr<Inner> inner;
};

struct Outer {
  Outer() : middle(Prototype::getInstance<Middle>()), inner(Prototype::getInstance<Inner>()) {}
  std::shared_ptr<Middle> middle;
  std::shared_ptr<Inner> inner;
};

struct FailsOnce {
  FailsOnce() {
    if (attempts++ == 0)
      throw std::runtime_error("cannot make FailsOnce: first attempt");
  }
  static inline int attempts = 0;
};

} // namespace

TEST(PrototypeTest, EachClassHasOneInstanceOfItsOwn) {
  const auto first = Prototype::getInstance<Counted<1>>();
  const auto again = Prototype::getInstance<Counted<1>>();
  ASSERT_NE(first, nullptr);
  EXPECT_EQ(first, again);
  EXPECT_EQ(Counted<1>::made, 1);

  const auto other = Prototype::getInstance<Counted<2>>();
  ASSERT_NE(other, nullptr);
  EXPECT_NE(static_cast<const void *>(other.get()), static_cast<const void *>(first.get()));
  EXPECT_EQ(other->value, 2);
  EXPECT_EQ(Counted<2>::made, 1);
  EXPECT_EQ(Counted<1>::made, 1);
}

TEST(PrototypeTest, ClearKeepsReachedInstancesAndLetsOthersBeMadeAfresh) {
  const auto reached = Prototype::getInstance<Counted<3>>();
  Prototype::clear();
  EXPECT_EQ(Prototype::getInstance<Counted<3>>(), reached);
  EXPECT_EQ(Counted<3>::made, 1);

  const auto fresh = Prototype::getInstance<Counted<4>>();
  ASSERT_NE(fresh, nullptr);
  EXPECT_EQ(fresh->value, 4);
  EXPECT_EQ(Prototype::getInstance<Counted<4>>(), fresh);
  EXPECT_EQ(Counted<4>::made, 1);

  // Clearing twice in a row and reaching both classes again changes nothing.
  Prototype::clear();
  Prototype::clear();
  EXPECT_EQ(Prototype::getInstance<Counted<3>>(), reached);
  EXPECT_EQ(Prototype::getInstance<Counted<4>>(), fresh);
}

TEST(PrototypeTest, ConstructorMayAskForOtherPrototypes) {
  const auto outer = Prototype::getInstance<Outer>();
  ASSERT_NE(outer, nullptr);
  EXPECT_EQ(outer->middle, Prototype::getInstance<Middle>());
  EXPECT_EQ(outer->inner, Prototype::getInstance<Inner>());
  EXPECT_EQ(outer->middle->inner, outer->inner);
  EXPECT_EQ(Inner::made, 1);
}

TEST(PrototypeTest, FailedConstructionLeavesNothingBehind) {
  EXPECT_THROW(Prototype::getInstance<FailsOnce>(), std::runtime_error);
  const auto made = Prototype::getInstance<FailsOnce>();
  ASSERT_NE(made, nullptr);
  EXPECT_EQ(Prototype::getInstance<FailsOnce>(), made);
  EXPECT_EQ(FailsOnce::attempts, 2);
}
