#include "wavemill/models/Interceptor.h"

#include "wavemill/models/ModelBase.h"
#include "wavemill/models/Transaction.h"

namespace Corvane::Wavemill {

namespace {

// Ids are handed out from 1 upwards, so 0 always means "no thread inside".
std::uint32_t nextThreadId() {
  static std::atomic<std::uint32_t> counter{0};
  std::uint32_t id = counter.fetch_add(1, std::memory_order_relaxed) + 1;
  while (id == 0)
    id = counter.fetch_add(1, std::memory_order_relaxed) + 1;
  return id;
}

} // namespace

Interceptor::Interceptor() : abandoned(std::make_unique<Transaction>(this, nullptr)) {}

Interceptor::Interceptor(std::shared_ptr<IModel> model) : Interceptor() { setRoot(std::move(model)); }

Interceptor::~Interceptor() {
  setCurrentTransaction(nullptr);
  services.clear();
  rootModel = nullptr;
  root.reset();
}

std::string Interceptor::toString() const { return "Interceptor"; }

void Interceptor::addService(const std::string &key, std::shared_ptr<IService> service) {
  services[key] = std::move(service);
}

std::shared_ptr<IService> Interceptor::getService(const std::string &key) { return services[key]; }

void Interceptor::couple(Transaction *transaction) {
  if (rootModel != nullptr)
    rootModel->couple(transaction);
}

Interceptor *Interceptor::empty() {
  static Interceptor instance;
  return &instance;
}

// Read on every write of a setting: a constant-initialised thread-local
// needs no guard, and the initial-exec model reaches it without a call into
// the dynamic loader.
#if defined(__GNUC__) && !defined(_WIN32)
#define WAVEMILL_FAST_TLS __attribute__((tls_model("initial-exec")))
#else
#define WAVEMILL_FAST_TLS
#endif

namespace {
thread_local std::uint32_t threadIdOfThisThread WAVEMILL_FAST_TLS = 0;
} // namespace

std::uint32_t Interceptor::currentThreadId() {
  std::uint32_t id = threadIdOfThisThread;
  if (id == 0)
    threadIdOfThisThread = id = nextThreadId();
  return id;
}

void Interceptor::setRoot(std::shared_ptr<IModel> model) {
  rootModel = dynamic_cast<ModelBase *>(model.get());
  root = std::move(model);
}

void Interceptor::abandon(const Transaction *transaction) {
  if (getCurrentTransaction() != transaction || transaction == abandoned.get())
    return;
  abandoned->parent = nullptr;
  abandoned->setting = transaction->setting;
  abandoned->option = transaction->option;
  abandoned->oldValue = transaction->oldValue;
  setCurrentTransaction(abandoned.get());
}

} // namespace Corvane::Wavemill
