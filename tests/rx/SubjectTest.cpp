#include "wavemill/rx/Subject.h"

#include <gtest/gtest.h>

#include <optional>
#include <stdexcept>
#include <string>
#include <thread>
#include <type_traits>

namespace {

using Log = std::vector<std::string>;

auto recordAs(Log &log, const std::string &who) {
  return [&log, who](int value) { log.push_back(who + std::to_string(value)); };
}

} // namespace

TEST(SubjectTest, DeliversInSubscriptionOrderOnTheCallerThreadUntilUnsubscribed) {
  Corvane::Wavemill::rx::subjects::subject<int> subject;
  EXPECT_FALSE(subject.has_observers());
  Log log;
  std::thread::id thread;
  auto a = subject.get_observable().subscribe(recordAs(log, "a"));
  subject.get_observable().subscribe([&](int value) { // handle dropped at once
    thread = std::this_thread::get_id();
    log.push_back("b" + std::to_string(value));
  });
  auto c = subject.get_observable().subscribe(recordAs(log, "c"));
  EXPECT_TRUE(subject.has_observers());
  const auto copy = subject; // a copy feeds the same observers
  copy.get_subscriber().on_next(1);
  EXPECT_EQ(log, (Log{"a1", "b1", "c1"})); // delivered before on_next returned
  EXPECT_EQ(thread, std::this_thread::get_id());

  a.unsubscribe();
  EXPECT_FALSE(a.is_subscribed());
  EXPECT_TRUE(c.is_subscribed());
  subject.get_subscriber().on_next(2);
  a.unsubscribe();
  c.unsubscribe();
  c.unsubscribe();
  subject.get_subscriber().on_next(3);
  EXPECT_EQ(log, (Log{"a1", "b1", "c1", "b2", "c2", "b3"}));
  EXPECT_TRUE(subject.has_observers());
  const Corvane::Wavemill::rx::subscription none;
  EXPECT_FALSE(none.is_subscribed());
  none.unsubscribe();
}

TEST(SubjectTest, SubscribingAndUnsubscribingDuringADeliveryTakeEffectAtOnce) {
  Corvane::Wavemill::rx::subjects::subject<int> subject;
  Log log;
  std::optional<Corvane::Wavemill::rx::subscription> late;
  Corvane::Wavemill::rx::subscription victim, self;
  auto first = subject.get_observable().subscribe([&](int value) {
    log.push_back("first" + std::to_string(value));
    victim.unsubscribe();
    if (!late)
      late = subject.get_observable().subscribe(recordAs(log, "late"));
  });
  self = subject.get_observable().subscribe([&](int value) {
    log.push_back("self" + std::to_string(value));
    self.unsubscribe();
  });
  victim = subject.get_observable().subscribe(recordAs(log, "victim"));
  auto last = subject.get_observable().subscribe(recordAs(log, "last"));

  // The removed ones get nothing more; the added one sees only later values.
  subject.get_subscriber().on_next(1);
  EXPECT_EQ(log, (Log{"first1", "self1", "last1"}));
  subject.get_subscriber().on_next(2);
  EXPECT_EQ(log, (Log{"first1", "self1", "last1", "first2", "last2", "late2"}));
  EXPECT_FALSE(victim.is_subscribed());
  EXPECT_FALSE(self.is_subscribed());
}

TEST(SubjectTest, ObserverMayPublishOnSameSubjectWhileBeingCalled) {
  Corvane::Wavemill::rx::subjects::subject<int> subject;
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
  Corvane::Wavemill::rx::subjects::subject<int> subject;
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
  Corvane::Wavemill::rx::subjects::subject<int> subject;
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

TEST(SubjectTest, CallbacksAreReleasedAfterTheirLastCallAndNeverUnderTheLock) {
  // A subscriber that outlives its subject keeps the observers; a
  // subscription can still end; a dropped subject takes its callbacks along.
  Log log;
  auto captured = std::make_shared<int>(0);
  Corvane::Wavemill::rx::subscription subscription, orphan;
  std::optional<Corvane::Wavemill::rx::subscriber<int>> subscriber;
  {
    Corvane::Wavemill::rx::subjects::subject<int> subject, dropped;
    subscription = subject.get_observable().subscribe(recordAs(log, "a"));
    subscriber = subject.get_subscriber();
    orphan = dropped.get_observable().subscribe([captured](int) {});
  }
  subscriber->on_next(1);
  subscription.unsubscribe();
  subscriber->on_next(2);
  EXPECT_EQ(log, (Log{"a1"}));
  EXPECT_EQ(captured.use_count(), 1);
  orphan.unsubscribe();
  EXPECT_FALSE(orphan.is_subscribed());

  // An ended subscription releases its callback at once: a kept handle makes
  // no cycle.
  Corvane::Wavemill::rx::subjects::subject<int> subject;
  auto plain = subject.get_observable().subscribe([captured](int) {});
  EXPECT_EQ(captured.use_count(), 2);
  plain.unsubscribe();
  EXPECT_EQ(captured.use_count(), 1);

  // A callback that ends itself still runs to its end on intact captures.
  auto counter = std::make_shared<int>(0);
  Corvane::Wavemill::rx::subscription self;
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
  auto other =
      std::make_shared<Corvane::Wavemill::rx::subscription>(subject.get_observable().subscribe(recordAs(log, "other")));
  std::shared_ptr<void> endsOther(nullptr, [other](void *) { other->unsubscribe(); });
  auto owner = subject.get_observable().subscribe([endsOther](int) {});
  endsOther.reset();
  owner.unsubscribe();
  EXPECT_FALSE(other->is_subscribed());
  subject.get_subscriber().on_next(1);
  EXPECT_EQ(log, (Log{"a1"}));
}

// Stand-ins for the real RxCpp's names: an application that includes both
// must get two sets of classes, not redefinitions.
namespace rxcpp {
class subscription {};
namespace subjects {
template <class T> class subject {};
} // namespace subjects
} // namespace rxcpp

TEST(SubjectTest, LivesBesideRxCppInAnApplication) {
  static_assert(!std::is_same_v<rxcpp::subscription, Corvane::Wavemill::rx::subscription>);
  rxcpp::subjects::subject<int> theirs;
  Corvane::Wavemill::rx::subjects::subject<int> ours;
  int received = 0;
  auto subscription = ours.get_observable().subscribe([&](int value) { received = value; });
  ours.get_subscriber().on_next(3);
  EXPECT_EQ(received, 3);
  (void)theirs;
}
