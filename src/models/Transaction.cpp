#include "wavemill/models/Transaction.h"

#include "wavemill/models/ContextSetting.h"
#include "wavemill/models/Interceptor.h"
#include "wavemill/models/ModelBase.h"

#include <cstdlib>
#include <stdexcept>

namespace Corvane::Wavemill {

Interceptor *Transaction::getInterceptor() const { return interceptor; }

Setting *Transaction::getSetting() const {
  if (setting != nullptr)
    return setting;
  static ContextSetting fallback("TransactionContext");
  return &fallback;
}

bool Transaction::hasLoop(ModelBase *model) const {
  Interceptor *target = model != nullptr ? model->getInterceptor() : nullptr;
  for (const Transaction *each = this; each != nullptr; each = each->parent)
    if (each->getInterceptor() == target)
      return true;
  return false;
}

std::shared_ptr<Transaction> Transaction::propagate(ModelBase *model, PropagationOption propagation,
                                                    TransactionOption transactionOption) {
  if (model == nullptr || hasLoop(model))
    return empty();
  std::shared_ptr<Transaction> result;
  switch (propagation) {
  case PropagationOption::PropagateWithOption:
    result = model->beginEdit(transactionOption);
    break;
  case PropagationOption::PropagateAndCouple:
    result = model->beginEdit(TransactionOption::NoCouple);
    break;
  default:
    result = model->beginEdit(TransactionOption::NoCouple);
    break;
  }
  result->setParent(this);
  if (propagation == PropagationOption::PropagateAndCouple)
    model->couple(result.get());
  return result;
}

std::shared_ptr<Transaction> Transaction::propagate(const std::shared_ptr<ModelBase> &model,
                                                    PropagationOption propagation, TransactionOption option) {
  return propagate(model.get(), propagation, option);
}

std::string Transaction::getMethodName() const { return {}; }

std::shared_ptr<Setting> Transaction::getSettingAt(int) const { return nullptr; }

void Transaction::setParent(Transaction *transaction) {
  if (getInterceptor() != nullptr)
    parent = transaction;
}

std::shared_ptr<Transaction> Transaction::empty() {
  static const std::shared_ptr<Transaction> instance = std::make_shared<Transaction>(nullptr, nullptr);
  return instance;
}

SyncTransaction::SyncTransaction(Interceptor *interceptor, Setting *setting, TransactionOption option)
    : Transaction(interceptor, setting, option) {
  enter();
}

SyncTransaction::SyncTransaction(Interceptor *interceptor, Setting *setting, const std::string &methodName,
                                 std::shared_ptr<Arguments> arguments)
    : Transaction(interceptor, setting, TransactionOption::Couple), arguments(std::move(arguments)),
      methodName(methodName) {
  enter();
}

void SyncTransaction::enter() {
  if (interceptor == nullptr)
    return;
  lock = std::unique_lock<std::mutex>(interceptor->getMutex());
  interceptor->setThreadId(Interceptor::currentThreadId());
  interceptor->setCurrentTransaction(this);
}

SyncTransaction::~SyncTransaction() {
  if (interceptor == nullptr)
    return;
  if (option != TransactionOption::NoCouple) {
    try {
      interceptor->couple(this);
    } catch (...) {
      // A coupling never fails the edit that caused it.
      interceptor->setThreadId(0);
    }
  }
  interceptor->setCurrentTransaction(nullptr);
  interceptor->setThreadId(0);
  if (lock.owns_lock()) {
    try {
      lock.unlock();
    } catch (...) {
      // The lock cannot be left held and a destructor must not throw.
      std::abort();
    }
  }
}

Interceptor *SyncTransaction::getInterceptor() const { return interceptor; }

Setting *SyncTransaction::getSetting() const { return setting; }

std::string SyncTransaction::getMethodName() const { return methodName; }

std::shared_ptr<Setting> SyncTransaction::getSettingAt(int index) const {
  if (!arguments || index < 0 || static_cast<std::size_t>(index) > arguments->size())
    return nullptr;
  return arguments->at(static_cast<std::size_t>(index));
}

} // namespace Corvane::Wavemill
