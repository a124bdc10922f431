#pragma once

// A small synchronous reactive layer with the names and meaning of RxCpp for
// the subset the library uses: a subject, its subscriber, its observable and
// the subscription that subscribe() returns. It lives in the library's own
// namespace, so an application may use the real RxCpp beside it.

#include <atomic>
#include <cstddef>
#include <functional>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

namespace Corvane::Wavemill::rx {

namespace detail {

/// What a subscription refers to: something that can be ended once.
class subscription_state {
public:
  virtual ~subscription_state() = default;
  virtual void unsubscribe() = 0;
  bool is_subscribed() const { return subscribed.load(std::memory_order_acquire); }

protected:
  std::atomic<bool> subscribed{true};
};

template <class T> class subject_state;

/// The link of one observer back to its subject; this, and not the callback,
/// is what a subscription holds, so that ending a subscription or dropping
/// the subject releases the callback and whatever it captured.
template <class T> class observer_token final : public subscription_state {
public:
  explicit observer_token(std::weak_ptr<subject_state<T>> owner) : owner(std::move(owner)) {}

  void unsubscribe() override {
    if (!subscribed.exchange(false, std::memory_order_acq_rel))
      return;
    if (auto state = owner.lock())
      state->remove(this);
  }

  /// Marks the observer ended without touching the subject's list.
  void end() { subscribed.store(false, std::memory_order_release); }

private:
  const std::weak_ptr<subject_state<T>> owner;
};

/// One observer as the subject keeps it: its token and its callback.
template <class T> struct observer_entry {
  std::shared_ptr<observer_token<T>> token;
  std::function<void(const T &)> next;

  void deliver(const T &value) const {
    // An observer ended while this value was on its way gets nothing more.
    if (token->is_subscribed())
      next(value);
  }
};

/// The shared state of a subject. Observers are kept in an immutable list
/// that is replaced on every subscribe and unsubscribe, so a delivery works
/// on a snapshot without holding the lock while callbacks run. A callback
/// is destroyed only after the last delivery that holds it has finished,
/// and never under the lock, since its destructor may reach the subject.
template <class T> class subject_state : public std::enable_shared_from_this<subject_state<T>> {
public:
  using list = std::vector<std::shared_ptr<const observer_entry<T>>>;

  std::shared_ptr<observer_token<T>> add(std::function<void(const T &)> next) {
    auto token = std::make_shared<observer_token<T>>(this->weak_from_this());
    auto entry = std::make_shared<const observer_entry<T>>(observer_entry<T>{token, std::move(next)});
    std::shared_ptr<const list> replaced;
    std::lock_guard<std::mutex> guard(mutex);
    if (completed.load(std::memory_order_relaxed)) {
      token->end();
      return token;
    }
    auto grown = std::make_shared<list>();
    grown->reserve((observers ? observers->size() : 0) + 1);
    if (observers)
      *grown = *observers;
    grown->push_back(std::move(entry));
    count.store(grown->size(), std::memory_order_release);
    replaced = std::exchange(observers, std::move(grown));
    return token;
  }

  void remove(const observer_token<T> *token) {
    // Declared before the guard: the last reference to a removed callback may
    // sit in the old list, and its destructor must run after the unlock.
    std::shared_ptr<const list> replaced;
    std::lock_guard<std::mutex> guard(mutex);
    if (!observers)
      return;
    auto shrunk = std::make_shared<list>();
    shrunk->reserve(observers->size());
    for (const auto &each : *observers)
      if (each->token.get() != token)
        shrunk->push_back(each);
    count.store(shrunk->size(), std::memory_order_release);
    replaced = std::move(observers);
    if (!shrunk->empty())
      observers = std::move(shrunk);
  }

  void next(const T &value) {
    // No observers is the common case for most settings: skip the lock.
    if (count.load(std::memory_order_acquire) == 0)
      return;
    std::shared_ptr<const list> snapshot;
    {
      std::lock_guard<std::mutex> guard(mutex);
      snapshot = observers;
    }
    if (!snapshot)
      return;
    for (const auto &entry : *snapshot)
      entry->deliver(value);
  }

  void complete() {
    std::shared_ptr<const list> snapshot;
    {
      std::lock_guard<std::mutex> guard(mutex);
      completed.store(true, std::memory_order_relaxed);
      snapshot = std::move(observers);
      observers.reset();
      count.store(0, std::memory_order_release);
    }
    if (snapshot)
      for (const auto &entry : *snapshot)
        entry->token->end();
  }

  bool is_completed() const { return completed.load(std::memory_order_relaxed); }
  bool has_observers() const { return count.load(std::memory_order_acquire) != 0; }

private:
  std::mutex mutex;
  std::shared_ptr<const list> observers;
  std::atomic<std::size_t> count{0};
  std::atomic<bool> completed{false};
};

} // namespace detail

/// The handle that subscribe() returns. Dropping it does not end the
/// subscription; unsubscribe() does, from any thread, also from inside a
/// callback. After unsubscribe() the observer receives nothing more from
/// deliveries on the same thread, including the one under way; a delivery
/// that another thread has already begun may still reach it, so state that
/// the callback uses must outlive it until such deliveries are over. The
/// handle does not own the callback: the subject releases it once the
/// subscription has ended and no delivery holds it any more.
class subscription {
public:
  subscription() = default;
  explicit subscription(std::shared_ptr<detail::subscription_state> state) : state(std::move(state)) {}

  /// True until unsubscribe() was called or the subject completed.
  bool is_subscribed() const { return state && state->is_subscribed(); }

  /// Ends the subscription; a second call does nothing.
  void unsubscribe() const {
    if (state)
      state->unsubscribe();
  }

private:
  std::shared_ptr<detail::subscription_state> state;
};

/// RxCpp returns a composite subscription from subscribe(); one name serves.
using composite_subscription = subscription;

/// The producer side of a subject. on_next delivers synchronously on the
/// calling thread to every observer, in the order they subscribed. It takes
/// no lock across the callbacks and allocates nothing. An exception thrown by
/// an observer leaves on_next and reaches the caller; later observers of that
/// value are then not called.
template <class T> class subscriber {
public:
  explicit subscriber(std::shared_ptr<detail::subject_state<T>> state) : state(std::move(state)) {}

  void on_next(const T &value) const { state->next(value); }
  void on_completed() const { state->complete(); }

  /// True while the subject has not completed.
  bool is_subscribed() const { return !state->is_completed(); }

private:
  std::shared_ptr<detail::subject_state<T>> state;
};

/// The consumer side of a subject.
template <class T> class observable {
public:
  explicit observable(std::shared_ptr<detail::subject_state<T>> state) : state(std::move(state)) {}

  /// Adds an observer called with each value; safe from any thread and from
  /// inside a callback (the new observer sees the next value, not the current).
  template <class OnNext> subscription subscribe(OnNext &&onNext) const {
    return subscription(state->add(std::function<void(const T &)>(std::forward<OnNext>(onNext))));
  }

private:
  std::shared_ptr<detail::subject_state<T>> state;
};

namespace subjects {

/// A hot, synchronous subject. Copies share one set of observers.
///
/// The shared state is made when it is first asked for (a subscriber, an
/// observable or a copy): most subjects, such as those of settings, are
/// never observed, and a tree of thousands of models then makes none.
template <class T> class subject {
public:
  subject() = default;
  subject(const subject &other) : state(other.shared()), raw(state.get()) {}
  /// Not safe against a parallel use of this subject, as in RxCpp.
  subject &operator=(const subject &other) {
    if (this != &other) {
      state = other.shared();
      raw.store(state.get(), std::memory_order_release);
    }
    return *this;
  }

  subscriber<T> get_subscriber() const { return subscriber<T>(shared()); }
  observable<T> get_observable() const { return observable<T>(shared()); }

  /// True when at least one observer is subscribed.
  bool has_observers() const {
    const auto *current = raw.load(std::memory_order_acquire);
    return current != nullptr && current->has_observers();
  }

private:
  // The state, made once whichever thread asks first. After the first call
  // a single atomic load stands between a caller and the state.
  const std::shared_ptr<detail::subject_state<T>> &shared() const {
    if (raw.load(std::memory_order_acquire) == nullptr)
      std::call_once(made, [this] {
        if (!state)
          state = std::make_shared<detail::subject_state<T>>();
        raw.store(state.get(), std::memory_order_release);
      });
    return state;
  }

  mutable std::once_flag made;
  mutable std::shared_ptr<detail::subject_state<T>> state;
  mutable std::atomic<detail::subject_state<T> *> raw{nullptr};
};

} // namespace subjects
} // namespace Corvane::Wavemill::rx
