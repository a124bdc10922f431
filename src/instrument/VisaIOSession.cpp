#include "wavemill/instrument/VisaIOSession.h"

#include "instrument/VisaSession.h"
#include "wavemill/tools/Exceptions.h"

namespace Corvane::Wavemill {

namespace {

constexpr const char *writeError = "An I/O error occurred while attempting to write to GPIB connection ";
constexpr const char *readError = "An I/O error occurred while attempting to read from GPIB connection ";

} // namespace

VisaIOSession::VisaIOSession(std::string address) : session(std::make_shared<VisaSession>(std::move(address))) {}

VisaIOSession::~VisaIOSession() { close(); }

std::string VisaIOSession::getAddress() const { return session->getAddress(); }

bool VisaIOSession::getConnected() const { return session != nullptr && session->isOpen; }

int VisaIOSession::getTimeoutInMS() {
  std::lock_guard<std::mutex> lock(session->mutex);
  if (session->isOpen)
    session->getTimeout(timeoutInMS);
  return timeoutInMS;
}

void VisaIOSession::setTimeoutInMS(int value) {
  std::lock_guard<std::mutex> lock(session->mutex);
  timeoutInMS = value;
  if (session->isOpen)
    session->setTimeout(value);
}

bool VisaIOSession::connect() {
  if (session != nullptr && !session->isOpen) {
    // A resource that will not open is a false answer, not an error.
    try {
      std::lock_guard<std::mutex> lock(session->mutex);
      session->open();
    } catch (const std::exception &) {
    }
    if (session->isOpen)
      setTimeoutInMS(timeoutInMS);
  }
  return getConnected();
}

void VisaIOSession::clear() {
  std::lock_guard<std::mutex> lock(session->mutex);
  session->clear();
}

void VisaIOSession::close() {
  // close() runs from the destructor and must not throw.
  try {
    std::lock_guard<std::mutex> lock(session->mutex);
    session->close();
  } catch (...) {
  }
}

std::string VisaIOSession::getBlockEnd() const { return {}; }

void VisaIOSession::setBlockEnd(std::string) {}

void VisaIOSession::writeLine(const std::string &text) {
  // The test of the connection is made under the lock, so that a close()
  // from another thread cannot come between it and the write.
  std::lock_guard<std::mutex> lock(session->mutex);
  if (!session->isOpen)
    throw InstrumentException(writeError + session->address);
  session->write(text, true);
}

std::string VisaIOSession::readLine() {
  std::lock_guard<std::mutex> lock(session->mutex);
  if (!session->isOpen)
    throw InstrumentException(readError + session->address);
  return session->read();
}

void VisaIOSession::writeBlock(const std::string &command, gsl::span<unsigned char> data) {
  std::lock_guard<std::mutex> lock(session->mutex);
  session->writeBlock(command, data);
}

void VisaIOSession::writeManyBlocksStart(const std::string &command, gsl::span<unsigned char> firstPart,
                                         int totalLength) {
  std::lock_guard<std::mutex> lock(session->mutex);
  session->writeManyBlocksStart(command, firstPart, totalLength);
}

void VisaIOSession::writeManyBlocks(gsl::span<unsigned char> part) {
  std::lock_guard<std::mutex> lock(session->mutex);
  session->writeBinary(part.data(), static_cast<int>(part.size()), 102400, false);
}

std::vector<unsigned char> VisaIOSession::readBlock(const std::string &command) {
  std::lock_guard<std::mutex> lock(session->mutex);
  if (!session->isOpen)
    throw InstrumentException(readError + session->address);
  return session->readBlock(command);
}

void VisaIOSession::writeManyBlocksEnd() {
  std::lock_guard<std::mutex> lock(session->mutex);
  const unsigned char end = 0;
  session->writeBinary(&end, 1, 1024, true);
}

std::vector<std::string> VisaIOSession::discover(std::string expression) { return VisaSession::discover(expression); }

} // namespace Corvane::Wavemill
