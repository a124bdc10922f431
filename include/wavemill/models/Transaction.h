#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/TransactionOption.h"

#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

class ModelBase;
class Setting;

/// The record of one outermost change of a tree: the setting or model that
/// started it, the option, the old value, and the transaction of another
/// tree that caused it. setValue keeps one on its stack; edits that span
/// several writes use a SyncTransaction.
class WAVEMILL_API Transaction {
public:
  Transaction(Interceptor *interceptor, Setting *setting)
      : interceptor(interceptor), setting(setting), option(TransactionOption::NoCouple) {}
  Transaction(Interceptor *interceptor, Setting *setting, TransactionOption option)
      : interceptor(interceptor), setting(setting), option(option) {}
  virtual ~Transaction() {
    if (interceptor != nullptr && interceptor->getCurrentTransaction() == this)
      interceptor->abandon(this);
  }

  Transaction(const Transaction &) = delete;
  Transaction &operator=(const Transaction &) = delete;

  virtual Interceptor *getInterceptor() const;
  /// The setting that started the change; never null: without one, a shared
  /// ContextSetting named "TransactionContext".
  virtual Setting *getSetting() const;
  /// Opens an edit of `model`'s tree caused by this transaction. Returns the
  /// shared empty transaction when this transaction or one of its parents
  /// already belongs to that tree (the loop guard). See PropagationOption.
  virtual std::shared_ptr<Transaction> propagate(ModelBase *model, PropagationOption propagation,
                                                 TransactionOption option);
  virtual std::shared_ptr<Transaction> propagate(const std::shared_ptr<ModelBase> &model, PropagationOption propagation,
                                                 TransactionOption option);
  /// The name of the operation that runs; empty for a plain transaction.
  virtual std::string getMethodName() const;
  /// The i-th argument of the operation; null for a plain transaction.
  virtual std::shared_ptr<Setting> getSettingAt(int index) const;

  Transaction *getParent() const { return parent; }
  /// Links this transaction to the one that caused it; ignored on a
  /// transaction without Interceptor, so the shared empty one never changes.
  void setParent(Transaction *transaction);
  const std::shared_ptr<Setting> &getOldValue() const { return oldValue; }
  void setOldValue(std::shared_ptr<Setting> value) { oldValue = std::move(value); }
  TransactionOption getOption() const { return option; }
  void setOption(TransactionOption value) { option = value; }

  /// One shared transaction with no Interceptor, no setting and option
  /// NoCouple. Inactive and nested edits get it, so that callers write the
  /// same code in every state; dropping it does nothing.
  static std::shared_ptr<Transaction> empty();

protected:
  /// True when this transaction or one of its parents belongs to the tree
  /// of `model`.
  bool hasLoop(ModelBase *model) const;

  Transaction *parent = nullptr;
  Interceptor *interceptor;
  Setting *setting;
  TransactionOption option;
  std::shared_ptr<Setting> oldValue;

private:
  friend class Interceptor;
};

/// The transaction that owns the tree's lock, for edits that span several
/// writes. The constructor blocks until the lock is free and records the
/// calling thread as inside the tree, so every write of this thread is
/// nested until the transaction is dropped; dropping it couples once (unless
/// the option is NoCouple) and opens the lock. It must be destroyed on the
/// thread that created it. A coupling's exception is swallowed.
class WAVEMILL_API SyncTransaction : public Transaction, public std::enable_shared_from_this<SyncTransaction> {
public:
  using Arguments = std::vector<std::shared_ptr<Setting>>;

  SyncTransaction(Interceptor *interceptor, Setting *setting, TransactionOption option);
  /// A method transaction with option Couple; `arguments` may be null.
  SyncTransaction(Interceptor *interceptor, Setting *setting, const std::string &methodName,
                  std::shared_ptr<Arguments> arguments);
  ~SyncTransaction() override;

  Interceptor *getInterceptor() const override;
  /// The setting given at construction, as it is.
  Setting *getSetting() const override;
  std::string getMethodName() const override;
  /// The i-th argument; null without arguments or for i < 0 or i > count.
  /// For i equal to the count the bounds check of the list throws
  /// std::out_of_range.
  std::shared_ptr<Setting> getSettingAt(int index) const override;

private:
  void enter();

  std::shared_ptr<Arguments> arguments;
  std::string methodName;
  std::unique_lock<std::mutex> lock;
};

} // namespace Corvane::Wavemill
