#include "wavemill/instrument/HardwareResource.h"

#include "wavemill/instrument/IInstrument.h"
#include "wavemill/tools/Exceptions.h"
#include "wavemill/tools/Tools.h"

#include <stdexcept>
#include <utility>
#include <vector>

namespace Corvane::Wavemill {

namespace {

bool isSeparator(char c) { return c == ' ' || c == ','; }

std::string finish(std::string message, bool throwIfMissing) {
  if (throwIfMissing && !message.empty())
    throw InstrumentException(std::move(message));
  return message;
}

} // namespace

HardwareResource::HardwareResource() = default;
HardwareResource::~HardwareResource() = default;

void HardwareResource::updateConnection(std::shared_ptr<IInstrument> instrument) {
  if (!instrument)
    throw std::invalid_argument("instrument");
  if (valid && Tools::compareIgnoreCase(instrument->getAddress(), address))
    return;
  std::string answer = instrument->query("*IDN?", -1);
  if (answer.empty()) {
    valid = false;
    return;
  }
  clearData();
  setIdentity(std::move(answer));
  setAddress(instrument->getAddress());
  const auto fields = Tools::split(identity, ',');
  if (fields.size() < 4)
    return;
  setManufacturer(Tools::trim(fields[0], ' '));
  setModelNumber(Tools::trim(fields[1], ' '));
  setSerialNumber(Tools::trim(fields[2], ' '));
  setFirmwareRevision(Tools::trim(fields[3], ' '));
  setOptions(instrument->getOptions());
  setExtOptions(instrument->getExternalOptions());
  valid = true;
}

bool HardwareResource::has(const std::string &option) {
  const std::string o = Tools::trim(option, ' ');
  if (o.empty())
    return true;
  const auto position = options.find(o);
  if (position == std::string::npos)
    return false;
  if (position != 0 && !isSeparator(options[position - 1]))
    return false;
  if (position + o.size() == options.size())
    return true;
  // The index is the option's length from the start of the list, not from
  // the occurrence: an inner option holds only at position 0. Applications
  // have their option tables tuned to this, so it stays.
  return isSeparator(options[o.size()]);
}

bool HardwareResource::hasAny(const std::string &list) {
  if (list.empty())
    return true;
  auto parts = Tools::split(list, ',');
  return hasAny(gsl::span<std::string>(parts));
}

bool HardwareResource::hasAny(gsl::span<std::string> list) {
  if (list.empty())
    return true;
  for (const auto &option : list)
    if (has(option))
      return true;
  return false;
}

std::string HardwareResource::checkAll(const std::string &list, bool throwIfMissing) {
  if (list.empty())
    return {};
  auto parts = Tools::split(list, ',');
  return checkAll(gsl::span<std::string>(parts), throwIfMissing);
}

std::string HardwareResource::checkAll(gsl::span<std::string> list, bool throwIfMissing) {
  std::vector<std::string> missing;
  for (const auto &option : list)
    if (!has(option))
      missing.push_back(option);
  if (missing.empty())
    return {};
  if (missing.size() == 1)
    return finish("Option " + missing.front() + " is required for " + modelNumber + ".", throwIfMissing);
  return finish("Options " + join(missing) + "are required for " + modelNumber + ".", throwIfMissing);
}

std::string HardwareResource::checkAny(const std::string &list, bool throwIfMissing) {
  if (list.empty())
    return {};
  auto parts = Tools::split(list, ',');
  return checkAny(gsl::span<std::string>(parts), throwIfMissing);
}

std::string HardwareResource::checkAny(gsl::span<std::string> list, bool throwIfMissing) {
  if (list.empty() || hasAny(list))
    return {};
  if (list.size() == 1)
    return finish("Option " + list[0] + "is required for " + modelNumber + ".", throwIfMissing);
  return finish("One of the options(" + Tools::join(list, "/") + ") is required for " + modelNumber + ".",
                throwIfMissing);
}

std::string HardwareResource::join(gsl::span<std::string> parts) {
  const auto count = static_cast<std::ptrdiff_t>(parts.size());
  std::string text;
  for (std::ptrdiff_t i = 0; i < count; ++i) {
    text += parts[static_cast<std::size_t>(i)];
    if (i >= 1 && i < count - 2)
      text += ", ";
    else if (i >= 1 && i == count - 2)
      text += "and ";
  }
  return text;
}

std::string HardwareResource::getAddress() const { return address; }

void HardwareResource::setAddress(const std::string &newAddress) {
  if (Tools::compareIgnoreCase(newAddress, address))
    return;
  address = newAddress;
  valid = false;
  modelNumber.clear();
}

void HardwareResource::clear() {
  setAddress({});
  clearData();
}

void HardwareResource::clearData() {
  valid = false;
  identity.clear();
  manufacturer.clear();
  modelNumber.clear();
  serialNumber.clear();
  firmwareRevision.clear();
  options.clear();
  extOptions.clear();
  data.clear();
}

bool HardwareResource::isValid() const { return valid; }
std::string HardwareResource::getIdentity() const { return identity; }
std::string HardwareResource::getManufacturer() const { return manufacturer; }
std::string HardwareResource::getModelNumber() const { return modelNumber; }
std::string HardwareResource::getSerialNumber() const { return serialNumber; }
std::string HardwareResource::getFirmwareRevision() const { return firmwareRevision; }
std::string HardwareResource::getOptions() const { return options; }
std::string HardwareResource::getExtOptions() const { return extOptions; }
void HardwareResource::setIdentity(std::string value) { identity = std::move(value); }
void HardwareResource::setManufacturer(std::string value) { manufacturer = std::move(value); }
void HardwareResource::setModelNumber(std::string value) { modelNumber = std::move(value); }
void HardwareResource::setSerialNumber(std::string value) { serialNumber = std::move(value); }
void HardwareResource::setFirmwareRevision(std::string value) { firmwareRevision = std::move(value); }
void HardwareResource::setOptions(std::string value) { options = std::move(value); }
void HardwareResource::setExtOptions(std::string value) { extOptions = std::move(value); }

std::string HardwareResource::getDescription() const { return description; }
void HardwareResource::setDescription(std::string value) { description = std::move(value); }
int HardwareResource::getId() const { return id; }
void HardwareResource::setId(int value) { id = value; }

std::unordered_map<std::string, HardwareResource::RangeItem<double>> &HardwareResource::getRanges() { return ranges; }
const std::unordered_map<std::string, HardwareResource::RangeItem<double>> &HardwareResource::getRanges() const {
  return ranges;
}
std::unordered_map<std::string, std::string> &HardwareResource::getData() { return data; }
const std::unordered_map<std::string, std::string> &HardwareResource::getData() const { return data; }

} // namespace Corvane::Wavemill
