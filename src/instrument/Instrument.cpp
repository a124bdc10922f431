#include "wavemill/instrument/Instrument.h"

#include "tools/NumberText.h"
#include "wavemill/instrument/InstrumentIOSession.h"
#include "wavemill/instrument/VisaIOSession.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/tools/Exceptions.h"
#include "wavemill/tools/Finally.h"
#include "wavemill/tools/Tools.h"

#include <gsl/narrow>

#include <algorithm>
#include <charconv>
#include <stdexcept>
#include <utility>

namespace Corvane::Wavemill {

namespace {

// Every block goes out in parts of this size when it is sent in pieces,
// whatever threshold the caller chose.
constexpr std::size_t blockPart = 4096;

// printf's %f in the "C" locale: fixed notation, six places. The largest
// double has 309 digits before the point.
std::string formatFixed(double value) {
  char text[400];
  const auto written = std::to_chars(text, text + sizeof text, value, std::chars_format::fixed, 6);
  return std::string(text, written.ptr);
}

bool startsLikeNumber(char c) { return c == '+' || c == '-' || (c >= '0' && c <= '9'); }

} // namespace

Instrument::Instrument() : hardwareResource(std::make_shared<HardwareResource>()) {}

Instrument::Instrument(std::string address) : Instrument() {
  hardwareResource->setAddress(address);
  doConnect();
}

Instrument::~Instrument() {
  try {
    Instrument::disconnect();
  } catch (...) {
    // A destructor lets nothing out; a session that fails to close is gone
    // with this object anyway.
  }
}

std::string Instrument::toString() const { return "Instrument"; }

std::string Instrument::getAddress() const { return hardwareResource ? hardwareResource->getAddress() : std::string(); }

void Instrument::setAddress(const std::string &address) {
  if (hardwareResource)
    hardwareResource->setAddress(address);
}

bool Instrument::connect() { return doConnect(); }

bool Instrument::doConnect() {
  if (const auto present = session; present && present->getConnected())
    present->close();
  const std::string address = getAddress();
  if (!address.empty()) {
    setIOSession(InstrumentIOSession::create(address));
    return true;
  }
  setIOSession(nullptr);
  return false;
}

bool Instrument::disconnect() {
  if (const auto present = session; present && present->getConnected())
    present->close();
  session.reset();
  return true;
}

void Instrument::setIOSession(std::shared_ptr<InstrumentIOSession> newSession) { session = std::move(newSession); }

std::shared_ptr<HardwareResource> Instrument::getHardwareResource() const { return hardwareResource; }

std::string Instrument::getOptions() { return {}; }

std::string Instrument::getExternalOptions() { return {}; }

bool Instrument::checkConnection(std::string command, int timeout) {
  const std::string address = getAddress();
  if (address.empty())
    throw std::runtime_error("The instrument address is empty.");
  if (!session)
    connect();
  if (const auto present = session) {
    present->setTimeoutInMS(timeout > 0 ? timeout : timeoutInMS);
    if (present->connect())
      return true;
  }
  if (throwOnError)
    throw std::runtime_error("Failed to send SCPI " + command + " to " + address);
  return false;
}

bool Instrument::guarded(const std::string &command, const std::function<void(InstrumentIOSession &)> &calls) {
  Finally afterUse([this] {
    if (!disconnectAfterUse)
      return;
    try {
      disconnect();
    } catch (...) {
      // The operation's own result or exception is what the caller needs;
      // a failed close must not replace it, and Finally may not throw.
    }
  });
  try {
    // Our own reference: setIOSession on another thread cannot free the
    // session while its calls run.
    const auto present = session;
    if (!present)
      throw InstrumentException("Failed to send SCPI " + command + " to " + getAddress());
    calls(*present);
    return true;
  } catch (const std::exception &e) {
    // what() of the library's exceptions is the fixed "Application
    // Exception", so the session's own text does not reach the caller.
    // Applications match on this form; it stays.
    if (throwOnError)
      throw std::runtime_error(std::string(e.what()) + "(" + command + ")");
    return false;
  }
}

void Instrument::send(const std::string &command) {
  if (command.empty())
    throw std::invalid_argument("command");
  if (!checkConnection(command, timeoutInMS))
    return;
  const std::string text = removeBrackets(command);
  guarded(command, [&](InstrumentIOSession &s) {
    s.setTimeoutInMS(timeoutInMS);
    s.writeLine(text);
    // A query sent as a command must not leave its answer in the input,
    // where the next query would read it.
    const auto words = Tools::split(Tools::trim(text, ' '), ' ');
    if (!words.front().empty() && words.front().back() == '?')
      s.readLine();
  });
}

std::string Instrument::query(const std::string &command, int timeout) {
  if (command.empty())
    throw std::invalid_argument("command");
  if (timeout < -1)
    throw std::invalid_argument("timeoutInMS");
  if (timeout == -1)
    timeout = timeoutInMS;
  if (!checkConnection(command, timeout))
    return {};
  const std::string text = removeBrackets(command);
  std::string answer;
  if (!guarded(command, [&](InstrumentIOSession &s) {
        s.setTimeoutInMS(timeout);
        s.writeLine(text);
        answer = s.readLine();
      }))
    return {};
  return Tools::trim(answer, '\n');
}

std::string Instrument::readLine(int timeout) {
  const auto present = session;
  if (!present || !present->getConnected())
    return {};
  present->setTimeoutInMS(timeout);
  return Tools::trim(present->readLine(), '\n');
}

std::string Instrument::queryArray(const std::string &command) {
  if (command.empty())
    throw std::invalid_argument("query");
  if (!checkConnection(command, timeoutInMS))
    return {};
  std::string answer;
  if (!guarded(command, [&](InstrumentIOSession &s) {
        s.setTimeoutInMS(timeoutInMS);
        answer = s.queryArray(command);
      }))
    return {};
  return Tools::trim(answer, '\n');
}

std::vector<unsigned char> Instrument::queryBlock(const std::string &command, int timeout) {
  if (command.empty())
    throw std::invalid_argument("command");
  if (timeout < -1)
    throw ArgumentOutOfRangeException("timeoutInMS");
  // Here 0 is the marker for the default, and -1 goes to the session as it
  // is; callers of both query forms rely on their own marker.
  if (timeout == 0)
    timeout = timeoutInMS;
  if (!checkConnection(command, -1))
    return {};
  std::vector<unsigned char> block;
  if (!guarded(command, [&](InstrumentIOSession &s) {
        s.setTimeoutInMS(timeout);
        block = s.readBlock(command);
      }))
    return {};
  return block;
}

double Instrument::queryNumber(const std::string &command) {
  const std::string answer = query(command, -1);
  if (answer.empty())
    return 0.0;
  const auto read = NumberText::readDouble(answer);
  return read.status == NumberText::ReadStatus::ok ? read.value : 0.0;
}

void Instrument::sendNumber(const std::string &command, double value) {
  send(Tools::trim(command, ' ') + " " + formatFixed(value));
}

bool Instrument::sendIfDifferent(const std::string &command) {
  if (command.empty())
    throw std::invalid_argument("command");
  const auto words = Tools::split(command, ' ');
  if (words.size() != 2 || words[0].empty() || words[1].empty())
    throw std::invalid_argument("command");
  const std::string &header = words[0];
  const std::string &value = words[1];
  const std::string answer = query(header + "?", -1);
  if (answer.empty())
    throw std::invalid_argument("The SCPI command is incorrrect.");

  bool different = false;
  if (startsLikeNumber(answer.front()) && startsLikeNumber(value.front())) {
    const auto present = NumberText::readDouble(answer);
    const auto wanted = NumberText::readDouble(value);
    // A text that reads as no number cannot be compared; sending it would
    // not make it one, so it counts as the same. NaN differs from all.
    if (present.status == NumberText::ReadStatus::ok && wanted.status == NumberText::ReadStatus::ok)
      different = !(present.value == wanted.value);
  } else {
    // The instrument may answer the short form (VOLT) of a long-form value
    // (VOLTAGE); the bytes must match exactly, case included.
    different = answer.size() > value.size() || value.compare(0, answer.size(), answer) != 0;
  }
  if (different)
    send(command);
  return different;
}

void Instrument::sendBlock(const std::string &command, gsl::span<unsigned char> data, int maxBlockSize) {
  if (command.empty())
    throw std::invalid_argument("command");
  const auto threshold = static_cast<std::size_t>(std::max(maxBlockSize, static_cast<int>(blockPart)));
  const std::string trimmed = Tools::trim(command, ' ');
  std::string header;
  if (trimmed.find(' ') == std::string::npos)
    header = trimmed + " ";
  else if (trimmed.back() != ',')
    header = trimmed + ",";
  else
    header = command;
  if (!checkConnection(command, -1))
    return;
  guarded(command, [&](InstrumentIOSession &s) {
    s.setTimeoutInMS(timeoutInMS);
    // A VISA library takes a block of any size in one write; a socket gets
    // large blocks in parts so that no second copy of the data is made.
    if (dynamic_cast<VisaIOSession *>(&s) != nullptr || data.size() <= threshold) {
      s.writeBlock(header, data);
      return;
    }
    // The parts are handed on as views of the caller's data: copying each
    // into a buffer first would cost a second pass over the whole block.
    s.writeManyBlocksStart(header, data.subspan(0, blockPart), gsl::narrow<int>(data.size()));
    std::size_t offset = blockPart;
    for (; data.size() - offset >= blockPart; offset += blockPart)
      s.writeManyBlocks(data.subspan(offset, blockPart));
    if (offset < data.size())
      s.writeManyBlocks(data.subspan(offset));
    s.writeManyBlocksEnd();
  });
}

std::string Instrument::removeBrackets(std::string command) {
  const auto open = command.find('[');
  const auto blank = command.find(' ');
  if (open == std::string::npos || (blank != std::string::npos && blank < open))
    return command;
  const auto headerEnd = blank == std::string::npos ? command.size() : blank;
  std::string header = command.substr(0, headerEnd);
  header.erase(std::remove_if(header.begin(), header.end(), [](char c) { return c == '[' || c == ']'; }), header.end());
  return header + command.substr(headerEnd);
}

HardwareResource::RangeItem<double> Instrument::getOrCreate(const std::shared_ptr<Setting> &setting) {
  if (!setting || !hardwareResource)
    return {};
  // operator[] stores a default item under a name seen for the first time.
  return hardwareResource->getRanges()[setting->getName()];
}

void Instrument::clip(const std::shared_ptr<DoubleSetting> &setting) {
  if (!setting)
    return;
  const auto item = getOrCreate(setting);
  setting->setValue(Tools::clip(setting->getValue(), item.min, item.max, item.step));
}

void Instrument::clip(const std::shared_ptr<DoubleSetting> &setting, double step) {
  if (!setting)
    return;
  const auto item = getOrCreate(setting);
  setting->setValue(Tools::clip(setting->getValue(), item.min, item.max, step));
}

void Instrument::setAndClip(const std::shared_ptr<DoubleSetting> &setting, double min, double max) {
  setAndClip(setting, min, max, 0.0);
}

void Instrument::setAndClip(const std::shared_ptr<DoubleSetting> &setting, double min, double max, double step) {
  if (!setting)
    return;
  getOrCreate(setting);
  setting->setValue(Tools::clip(setting->getValue(), min, max, step));
}

void Instrument::queryAndClip(const std::shared_ptr<DoubleSetting> &setting,
                              const std::shared_ptr<Instrument> &instrument, const std::string &header) {
  if (!setting)
    return;
  if (!instrument)
    throw std::invalid_argument("instrument");
  const double min = instrument->queryNumber(header + "? MIN");
  const double max = instrument->queryNumber(header + "? MAX");
  getOrCreate(setting);
  setting->setValue(Tools::clip(setting->getValue(), min, max, 0.0));
}

} // namespace Corvane::Wavemill
