#include "wavemill/rx/Subject.h"

#include <gtest/gtest.h>

#include <optional>
#include <stdexcept>
#include <string>
#include <thread>
#include <type_traits>

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

TEST_F(SubjectDeliveryTest, DeliversInSubscriptionOrderOnTheCallerThreadUntilUnsubscribed) {
  EXPECT_FALSE(subject.has_observers());
  std::thread::id thread;
  auto a = subscribe("a");
  subject.get_observable().subscribe([&](int value) { // handle dropped at once
    thread = std::this_thread::get_id();
    log.push_back("b" + std::to_string(value));
  });
  const auto copy = subject; // a copy feeds the same observers
  copy.get_subscriber().on_next(1);
  EXPECT_EQ(log, (Log{"a1", "b1"})); // delivered before on_next returned
  EXPECT_EQ(thread, std::this_thread::get_id());

  a.unsubscribe();
  a.unsubscribe();
  EXPECT_FALSE(a.is_subscribed());
  publish(2);
  EXPECT_EQ(log, (Log{"a1", "b1", "b2"}));
  EXPECT_TRUE(subject.has_observers()); // a dropped handle does not end its subscription
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
  EXPECT_FALSE(self.is_subscribed());
}

TEST_F(SubjectDeliveryTest, ObserverExceptionReachesPublisherAndSubjectStaysUsable) {
  auto before = subscribe("before");
  auto thrower = subject.get_observable().subscribe([](int value) {
    if (value == 1)
      throw std::runtime_error("cannot take 1");
  });
  auto after = subscribe("after");
  EXPECT_THROW(publish(1), std::runtime_error);
  publish(2);
  EXPECT_EQ(log, (Log{"before1", "before2", "after2"}));
}

TEST_F(SubjectDeliveryTest, CompletionEndsEveryObserverAndLaterSubscriptions) {
  auto a = subscribe("a");
  const auto subscriber = subject.get_subscriber();
  subscriber.on_completed();
  EXPECT_FALSE(subscriber.is_subscribed());
  EXPECT_FALSE(a.is_subscribed());
  EXPECT_FALSE(subject.has_observers());
  EXPECT_FALSE(subscribe("late").is_subscribed());
  subscriber.on_next(1);
  EXPECT_TRUE(log.empty());
}

TEST_F(SubjectDeliveryTest, CallbacksAreReleasedAfterTheirLastCallAndNeverUnderTheLock) {
  // A subscriber that outlives its subject keeps the observers; a
  // subscription can still end; a dropped subject takes its callbacks along.
  auto captured = std::make_shared<int>(0);
  rx::subscription subscription, orphan;
  std::optional<rx::subscriber<int>> subscriber;
  {
    rx::subjects::subject<int> gone, dropped;
    subscription = gone.get_observable().subscribe(record("a"));
    subscriber = gone.get_subscriber();
    orphan = dropped.get_observable().subscribe([captured](int) {});
  }
  subscriber->on_next(1);
  subscription.unsubscribe();
  subscriber->on_next(2);
  EXPECT_EQ(log, (Log{"a1"}));
  EXPECT_EQ(captured.use_count(), 1);
  orphan.unsubscribe();

  // An ended subscription releases its callback at once: a kept handle makes
  // no cycle.
  auto plain = subject.get_observable().subscribe([captured](int) {});
  EXPECT_EQ(captured.use_count(), 2);
  plain.unsubscribe();
  EXPECT_EQ(captured.use_count(), 1);

  // A callback that ends itself and then uses its captures runs in every
  // round of SubjectConcurrencyTest.

  // A callback whose destruction ends another subscription of the same
  // subject: released outside the subject's lock, so this does not hang.
  auto other = std::make_shared<rx::subscription>(subscribe("other"));
  std::shared_ptr<void> endsOther(nullptr, [other](void *) { other->unsubscribe(); });
  auto owner = subject.get_observable().subscribe([endsOther](int) {});
  endsOther.reset();
  owner.unsubscribe();
  EXPECT_FALSE(other->is_subscribed());
}

// Stand-ins for the real RxCpp's names: an application that includes both
// must get two sets of classes, not redefinitions.
namespace rxcpp {
class subscription {};
namespace subjects {
template <class T> class subject {};
} // namespace subjects
} // namespace rxcpp

static_assert(!std::is_same_v<rxcpp::subscription, rx::subscription>);
static_assert(!std::is_same_v<rxcpp::subjects::subject<int>, rx::subjects::subject<int>>);
