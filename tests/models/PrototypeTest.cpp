#include "wavemill/models/Prototype.h"

#include <gtest/gtest.h>

#include <stdexcept>

using Corvane::Wavemill::Prototype;

namespace {

// Each class counts how often it was made, so that a second instance shows.
template <int Tag> struct Counted {
  Counted() { ++made; }
  static inline int made = 0;
  int value = Tag;
};

// Prototypes whose constructors ask for other prototypes.
struct Middle {
  std::shared_ptr<Counted<0>> inner = Prototype::getInstance<Counted<0>>();
};
struct Outer {
  std::shared_ptr<Middle> middle = Prototype::getInstance<Middle>();
  std::shared_ptr<Counted<0>> inner = Prototype::getInstance<Counted<0>>();
};

struct FailsOnce {
  FailsOnce() {
    if (attempts++ == 0)
      throw std::runtime_error("cannot make FailsOnce: first attempt");
  }
  static inline int attempts = 0;
};

} // namespace

TEST(PrototypeTest, EachClassHasOneInstanceOfItsOwnAndClearKeepsTheReachedOnes) {
  const auto first = Prototype::getInstance<Counted<1>>();
  EXPECT_EQ(first->value, 1);
  EXPECT_EQ(Prototype::getInstance<Counted<2>>()->value, 2);

  // After a clear, a class reached before keeps its instance and a new one
  // is made once; clearing twice and reaching both again changes nothing.
  Prototype::clear();
  EXPECT_EQ(Prototype::getInstance<Counted<1>>(), first);
  const auto fresh = Prototype::getInstance<Counted<4>>();
  Prototype::clear();
  Prototype::clear();
  EXPECT_EQ(Prototype::getInstance<Counted<1>>(), first);
  EXPECT_EQ(Prototype::getInstance<Counted<4>>(), fresh);
  EXPECT_EQ(Counted<1>::made, 1);
  EXPECT_EQ(Counted<4>::made, 1);
}

TEST(PrototypeTest, ConstructorMayAskForOtherPrototypes) {
  const auto outer = Prototype::getInstance<Outer>();
  EXPECT_EQ(outer->middle, Prototype::getInstance<Middle>());
  EXPECT_EQ(outer->inner, Prototype::getInstance<Counted<0>>());
  EXPECT_EQ(outer->middle->inner, outer->inner);
  EXPECT_EQ(Counted<0>::made, 1);
}

TEST(PrototypeTest, FailedConstructionLeavesNothingBehind) {
  EXPECT_THROW(Prototype::getInstance<FailsOnce>(), std::runtime_error);
  const auto made = Prototype::getInstance<FailsOnce>();
  ASSERT_NE(made, nullptr);
  EXPECT_EQ(Prototype::getInstance<FailsOnce>(), made);
  EXPECT_EQ(FailsOnce::attempts, 2);
}
