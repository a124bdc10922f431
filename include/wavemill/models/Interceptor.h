#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IService.h"
#include "wavemill/rx/Subject.h"

#include <atomic>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>

namespace Corvane::Wavemill {

class IModel;
class ISetting;
class ModelBase;
class Transaction;

/// The lock and the entrance of one model tree. All writes of a tree, from
/// any thread, are serial under its one plain mutex; the thread inside is
/// recorded by a 32-bit id, and a write by that thread is nested: it stores
/// and notifies but does not couple again. couple() runs the root model's
/// couplings once at the end of each outermost change.
///
/// The Interceptor owns the root and must outlive every model of the tree.
/// It is also a service provider for the tree.
class WAVEMILL_API Interceptor : public IServiceProvider {
public:
  Interceptor();
  /// An Interceptor with `root` as its root model (see setRoot).
  explicit Interceptor(std::shared_ptr<IModel> root);
  ~Interceptor() override;

  Interceptor(const Interceptor &) = delete;
  Interceptor &operator=(const Interceptor &) = delete;

  /// "Interceptor".
  std::string toString() const override;
  /// Stores `service` under `key`, replacing any entry.
  void addService(const std::string &key, std::shared_ptr<IService> service) override;
  /// The service under `key`; an unknown key gives null and is then present
  /// with an empty entry.
  std::shared_ptr<IService> getService(const std::string &key) override;

  /// Runs the root model's couple() with `transaction`, when there is a root.
  void couple(Transaction *transaction);

  /// One process-wide Interceptor without root, made on first call.
  static Interceptor *empty();

  /// The 32-bit id of the calling thread: never 0 for a live thread, and
  /// stable for the thread's life.
  static std::uint32_t currentThreadId();

  /// Settings with PublishChange publish themselves here when their value
  /// changed. Subscribers run on the writer's thread, inside the lock.
  rx::subjects::subject<ISetting *> &getSubject() { return subject; }

  const std::shared_ptr<IModel> &getRoot() const { return root; }
  /// Sets the root model, which must be a ModelBase to be coupled; the
  /// Interceptor keeps it alive.
  void setRoot(std::shared_ptr<IModel> model);

  /// The tree's lock.
  std::mutex &getMutex() { return mutex; }

  /// The id of the thread inside the tree, 0 when none. Read without the
  /// lock: only the owner can ever find its own id here.
  std::uint32_t getThreadId() const { return threadId.load(std::memory_order_relaxed); }
  void setThreadId(std::uint32_t id) { threadId.store(id, std::memory_order_relaxed); }
  /// True when the calling thread is inside a transaction of this tree.
  bool isInside() const { return getThreadId() == currentThreadId(); }

  /// The running outermost transaction, null when none.
  Transaction *getCurrentTransaction() const { return currentTransaction.load(std::memory_order_relaxed); }
  void setCurrentTransaction(Transaction *transaction) {
    currentTransaction.store(transaction, std::memory_order_relaxed);
  }

private:
  friend class Transaction;

  // A transaction that ends while it is still the current one (a read-only
  // write, an observer's exception) stays current by design; a copy of it
  // takes its place so that the pointer never dangles.
  void abandon(const Transaction *transaction);

  rx::subjects::subject<ISetting *> subject;
  std::shared_ptr<IModel> root;
  ModelBase *rootModel = nullptr;
  std::mutex mutex;
  std::atomic<std::uint32_t> threadId{0};
  std::atomic<Transaction *> currentTransaction{nullptr};
  std::map<std::string, std::shared_ptr<IService>> services;
  std::unique_ptr<Transaction> abandoned;
};

} // namespace Corvane::Wavemill
