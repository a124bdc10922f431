#include "wavemill/tools/Exceptions.h"

#include <utility>

namespace Corvane::Wavemill {

ApplicationException::ApplicationException(std::string message) : message(std::move(message)) {}
ApplicationException::ApplicationException(const ApplicationException &other) = default;
ApplicationException &ApplicationException::operator=(const ApplicationException &other) = default;
ApplicationException::~ApplicationException() = default;

const char *ApplicationException::what() const noexcept { return "Application Exception"; }

std::string ApplicationException::getMessage() const { return message; }

InstrumentException::InstrumentException(std::string message) : ApplicationException(std::move(message)) {}
InstrumentException::InstrumentException(const InstrumentException &other) = default;
InstrumentException &InstrumentException::operator=(const InstrumentException &other) = default;
InstrumentException::~InstrumentException() = default;

ArgumentException::ArgumentException(std::string message) : ApplicationException(std::move(message)) {}
ArgumentException::ArgumentException(const ArgumentException &other) = default;
ArgumentException &ArgumentException::operator=(const ArgumentException &other) = default;
ArgumentException::~ArgumentException() = default;

const char *ArgumentException::what() const noexcept { return "Argumen Exception"; }

ArgumentOutOfRangeException::ArgumentOutOfRangeException(std::string message) : ArgumentException(std::move(message)) {}
ArgumentOutOfRangeException::ArgumentOutOfRangeException(const ArgumentOutOfRangeException &other) = default;
ArgumentOutOfRangeException &ArgumentOutOfRangeException::operator=(const ArgumentOutOfRangeException &other) = default;
ArgumentOutOfRangeException::~ArgumentOutOfRangeException() = default;

} // namespace Corvane::Wavemill
