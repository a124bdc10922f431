#include "wavemill/rx/Subject.h"

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

namespace {

using Log = std::vector<std::string>;

auto recordAs(Log &log, const std::string &who) {
  return [&log, who](int value) { log.push_back(who + std::to_string(value)); };
}

} // namespace

TEST(SubjectTest, DeliversEachValueToAllObserversInSubscriptionOrderOnCallerThread) {
  rxcpp::subjects::subject<int> subject;
  EXPECT_FALSE(subject.has_observers());
  Log log;
  std::vector<std::thread::id> threads;
  auto a = subject.get_observable().subscribe(recordAs(log, "a"));
  auto b = subject.get_observable().subscribe([&](const int &value) {
    threads.push_back(std::this_thread::get_id());
    log.push_back("b" + std::to_string(value));
  });
  auto c = subject.get_observable().subscribe(recordAs(log, "c"));
  EXPECT_TRUE(subject.has_observers());

  const auto subscriber = subject.get_subscriber();
  subscriber.on_next(1);
  EXPECT_EQ(log, (Log{"a1", "b1", "c1"})); // delivered before on_next returned
  subscriber.on_next(2);
  EXPECT_EQ(log, (Log{"a1", "b1", "c1", "a2", "b2", "c2"}));
  EXPECT_EQ(threads, (std::vector<std::thread::id>{std::this_thread::get_id(), std::this_thread::get_id()}));

  // A copy of the subject feeds and reaches the same observers.
  const auto copy = subject;
  log.clear();
  copy.get_subscriber().on_next(3);
  EXPECT_EQ(log, (Log{"a3", "b3", "c3"}));
}

TEST(SubjectTest, UnsubscribeEndsOneObserverOnlyAndDroppingHandleDoesNot) {
  rxcpp::subjects::subject<int> subject;
  Log log;
  auto a = subject.get_observable().subscribe(recordAs(log, "a"));
  subject.get_observable().subscribe(recordAs(log, "b")); // handle dropped at once
  auto c = subject.get_observable().subscribe(recordAs(log, "c"));
  EXPECT_TRUE(a.is_subscribed());

  a.unsubscribe();
  EXPECT_FALSE(a.is_subscribed());
  EXPECT_TRUE(c.is_subscribed());
  subject.get_subscriber().on_next(1);
  EXPECT_EQ(log, (Log{"b1", "c1"}));

  a.unsubscribe();
  c.unsubscribe();
  c.unsubscribe();
  subject.get_subscriber().on_next(2);
  EXPECT_EQ(log, (Log{"b1", "c1", "b2"}));
  EXPECT_TRUE(subject.has_observers());

  const rxcpp::subscription none;
  EXPECT_FALSE(none.is_subscribed());
  none.unsubscribe();
}

TEST(SubjectTest, ObserverAddedDuringDeliverySeesOnlyLaterValues) {
  rxcpp::subjects::subject<int> subject;
  Log log;
  std::optional<rxcpp::subscription> late;
  auto first = subject.get_observable().subscribe([&](int value) {
    log.push_back("first" + std::to_string(value));
    if (!late)
      late = subject.get_observable().subscribe(recordAs(log, "late"));
  });
  auto last = subject.get_observable().subscribe(recordAs(log, "last"));

  subject.get_subscriber().on_next(1);
  EXPECT_EQ(log, (Log{"first1", "last1"}));
  subject.get_subscriber().on_next(2);
  EXPECT_EQ(log, (Log{"first1", "last1", "first2", "last2", "late2"}));
}

TEST(SubjectTest, ObserverRemovedDuringDeliveryGetsNothingMore) {
  rxcpp::subjects::subject<int> subject;
  Log log;
  rxcpp::subscription victim;
  rxcpp::subscription self;
  auto killer = subject.get_observable().subscribe([&](int value) {
    log.push_back("killer" + std::to_string(value));
    victim.unsubscribe();
  });
  self = subject.get_observable().subscribe([&](int value) {
    log.push_back("self" + std::to_string(value));
    self.unsubscribe();
  });
  victim = subject.get_observable().subscribe(recordAs(log, "victim"));
  auto bystander = subject.get_observable().subscribe(recordAs(log, "bystander"));

  subject.get_subscriber().on_next(1);
  EXPECT_EQ(log, (Log{"killer1", "self1", "bystander1"}));
  subject.get_subscriber().on_next(2);
  EXPECT_EQ(log, (Log{"killer1", "self1", "bystander1", "killer2", "bystander2"}));
  EXPECT_FALSE(victim.is_subscribed());
  EXPECT_FALSE(self.is_subscribed());
}

TEST(SubjectTest, ObserverMayPublishOnSameSubjectWhileBeingCalled) {
  rxcpp::subjects::subject<int> subject;
  Log log;
  const auto subscriber = subject.get_subscriber();
  auto countdown = subject.get_observable().subscribe([&](int value) {
    log.push_back("down" + std::to_string(value));
    if (value > 0)
      subscriber.on_next(value - 1);
  });
  auto after = subject.get_observable().subscribe(recordAs(log, "after"));

  subscriber.on_next(2);
  // Each nested value reaches everyone before the outer value goes on.
  EXPECT_EQ(log, (Log{"down2", "down1", "down0", "after0", "after1", "after2"}));
}

TEST(SubjectTest, ObserverExceptionReachesPublisherAndSubjectStaysUsable) {
  rxcpp::subjects::subject<int> subject;
  Log log;
  auto before = subject.get_observable().subscribe(recordAs(log, "before"));
  auto thrower = subject.get_observable().subscribe([](int value) {
    if (value == 1)
      throw std::runtime_error("cannot take 1");
  });
  auto after = subject.get_observable().subscribe(recordAs(log, "after"));

  EXPECT_THROW(subject.get_subscriber().on_next(1), std::runtime_error);
  EXPECT_EQ(log, (Log{"before1"}));
  subject.get_subscriber().on_next(2);
  EXPECT_EQ(log, (Log{"before1", "before2", "after2"}));
}

TEST(SubjectTest, CompletionEndsEveryObserverAndLaterSubscriptions) {
  rxcpp::subjects::subject<int> subject;
  Log log;
  auto a = subject.get_observable().subscribe(recordAs(log, "a"));
  const auto subscriber = subject.get_subscriber();
  EXPECT_TRUE(subscriber.is_subscribed());

  subscriber.on_completed();
  EXPECT_FALSE(subscriber.is_subscribed());
  EXPECT_FALSE(a.is_subscribed());
  EXPECT_FALSE(subject.has_observers());
  auto late = subject.get_observable().subscribe(recordAs(log, "late"));
  EXPECT_FALSE(late.is_subscribed());
  subscriber.on_next(1);
  EXPECT_TRUE(log.empty());
  a.unsubscribe();
  late.unsubscribe();
}

TEST(SubjectTest, SubscriptionAndSubscriberMayOutliveTheSubject) {
  Log log;
  rxcpp::subscription subscription;
  std::optional<rxcpp::subscriber<int>> subscriber;
  {
    rxcpp::subjects::subject<int> subject;
    subscription = subject.get_observable().subscribe(recordAs(log, "a"));
    subscriber = subject.get_subscriber();
  }
  // The subscriber keeps the observers alive; the subscription can still end.
  subscriber->on_next(1);
  subscription.unsubscribe();
  subscriber->on_next(2);
  EXPECT_EQ(log, (Log{"a1"}));
  EXPECT_FALSE(subscription.is_subscribed());

  auto captured = std::make_shared<int>(0);
  rxcpp::subscription orphan;
  {
    rxcpp::subjects::subject<int> subject;
    orphan = subject.get_observable().subscribe([captured](int) {});
  }
  EXPECT_EQ(captured.use_count(), 1); // the subject took its callbacks with it
  orphan.unsubscribe();
  EXPECT_FALSE(orphan.is_subscribed());
}

TEST(SubjectTest, EndedSubscriptionReleasesCallbackOnlyAfterItsLastCall) {
  rxcpp::subjects::subject<int> subject;
  auto captured = std::make_shared<int>(0);
  auto plain = subject.get_observable().subscribe([captured](int) {});
  EXPECT_EQ(captured.use_count(), 2);
  plain.unsubscribe();
  EXPECT_EQ(captured.use_count(), 1); // kept handle, no capture: no cycle

  // A callback that ends itself still runs to its end on intact captures.
  auto counter = std::make_shared<int>(0);
  rxcpp::subscription self;
  self = subject.get_observable().subscribe([&self, counter](int value) {
    self.unsubscribe();
    *counter += value;
  });
  std::weak_ptr<int> watch = counter;
  counter.reset();
  subject.get_subscriber().on_next(5);
  EXPECT_TRUE(watch.expired());

  // A callback whose destruction ends another subscription of the same
  // subject: released outside the subject's lock, so this does not hang.
  Log log;
  auto other = std::make_shared<rxcpp::subscription>(subject.get_observable().subscribe(recordAs(log, "other")));
  struct EndsOtherOnDestruction {
    std::shared_ptr<rxcpp::subscription> other;
    ~EndsOtherOnDestruction() {
      if (other)
        other->unsubscribe();
    }
  };
  auto guard = std::make_shared<EndsOtherOnDestruction>(EndsOtherOnDestruction{other});
  auto owner = subject.get_observable().subscribe([guard](int) {});
  guard.reset();
  owner.unsubscribe();
  EXPECT_FALSE(other->is_subscribed());
  subject.get_subscriber().on_next(1);
  EXPECT_TRUE(log.empty());
}
