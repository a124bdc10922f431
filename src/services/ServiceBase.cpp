#include "wavemill/services/ServiceBase.h"

namespace Corvane::Wavemill {

ServiceBase::~ServiceBase() = default;

void ServiceBase::setup() {}

bool ServiceBase::start() { return true; }

bool ServiceBase::stop() { return true; }

bool ServiceBase::isRunning() const { return true; }

std::string ServiceBase::toString() const { return "ServiceBase"; }

} // namespace Corvane::Wavemill
