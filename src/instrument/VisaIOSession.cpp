#include "wavemill/instrument/VisaIOSession.h"

#include "wavemill/tools/Exceptions.h"

namespace Corvane::Wavemill {

VisaIOSession::VisaIOSession(std::string address) : address(std::move(address)) {}

VisaIOSession::~VisaIOSession() = default;

std::string VisaIOSession::getAddress() const { return address; }

bool VisaIOSession::getConnected() const { return false; }

int VisaIOSession::getTimeoutInMS() { return timeoutInMS; }

void VisaIOSession::setTimeoutInMS(int value) { timeoutInMS = value; }

bool VisaIOSession::connect() { return false; }

void VisaIOSession::clear() {}

void VisaIOSession::close() {}

std::string VisaIOSession::getBlockEnd() const { return {}; }

void VisaIOSession::setBlockEnd(std::string) {}

void VisaIOSession::writeLine(const std::string &) {
  throw InstrumentException("An I/O error occurred while attempting to write to GPIB connection " + address);
}

std::string VisaIOSession::readLine() {
  throw InstrumentException("An I/O error occurred while attempting to read from GPIB connection " + address);
}

void VisaIOSession::writeBlock(const std::string &, gsl::span<unsigned char>) {}

void VisaIOSession::writeManyBlocksStart(const std::string &, gsl::span<unsigned char>, int) {}

void VisaIOSession::writeManyBlocks(gsl::span<unsigned char>) {}

std::vector<unsigned char> VisaIOSession::readBlock(const std::string &) {
  throw InstrumentException("An I/O error occurred while attempting to read from GPIB connection " + address);
}

void VisaIOSession::writeManyBlocksEnd() {}

std::vector<std::string> VisaIOSession::discover(std::string) { return {}; }

} // namespace Corvane::Wavemill
