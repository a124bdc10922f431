#include "wavemill/rx/Subject.h"

#include <gtest/gtest.h>

#include <optional>
#include <string>

namespace rx = Corvane::Wavemill::rx;

namespace {

using Log = std::vector<std::string>;

// A subject of numbers and a log of who received which value.
struct SubjectDeliveryTest : testing::Test {
  auto record(const std::string &who) {
    return [this, who](int value) { log.push_back(who + std::to_string(value)); };
  }
  rx::subscription subscribe(const std::string &who) { return subject.get_observable().subscribe(record(who)); }
  void publish(int value) { subject.get_subscriber().on_next(value); }

  rx::subjects::subject<int> subject;
  Log log;
};

} // namespace

TEST_F(SubjectDeliveryTest, DeliversInSubscriptionOrderUntilUnsubscribed) {
  EXPECT_FALSE(subject.has_observers());
  auto a = subscribe("a");
  subject.get_observable().subscribe(record("b")); // handle dropped at once
  const auto copy = subject;                       // a copy feeds the same observers
  copy.get_subscriber().on_next(1);
  EXPECT_EQ(log, (Log{"a1", "b1"}));

  a.unsubscribe();
  a.unsubscribe();
  EXPECT_FALSE(a.is_subscribed());
  publish(2);
  EXPECT_EQ(log, (Log{"a1", "b1", "b2"})); // a dropped handle does not end its subscription
  EXPECT_FALSE(rx::subscription().is_subscribed());
}

// Removed observers get nothing more, an added one only later values, and a
// nested value reaches everyone before the outer one goes on.
TEST_F(SubjectDeliveryTest, ObserversMaySubscribeUnsubscribeAndPublishDuringADelivery) {
  std::optional<rx::subscription> late;
  rx::subscription victim, self;
  auto first = subject.get_observable().subscribe([&](int value) {
    log.push_back("first" + std::to_string(value));
    victim.unsubscribe();
    if (!late)
      late = subscribe("late");
    if (value == 2)
      publish(1);
  });
  self = subject.get_observable().subscribe([&](int value) {
    log.push_back("self" + std::to_string(value));
    self.unsubscribe();
  });
  victim = subscribe("victim");
  auto last = subscribe("last");
  publish(0);
  EXPECT_EQ(log, (Log{"first0", "self0", "last0"}));
  publish(2);
  EXPECT_EQ(log, (Log{"first0", "self0", "last0", "first2", "first1", "last1", "late1", "last2", "late2"}));
}

TEST_F(SubjectDeliveryTest, CompletionEndsEveryObserverAndLaterSubscriptions) {
  auto a = subscribe("a");
  const auto subscriber = subject.get_subscriber();
  subscriber.on_completed();
  EXPECT_FALSE(subscriber.is_subscribed());
  EXPECT_FALSE(a.is_subscribed());
  EXPECT_FALSE(subscribe("late").is_subscribed());
  subscriber.on_next(1);
  EXPECT_TRUE(log.empty());
}
