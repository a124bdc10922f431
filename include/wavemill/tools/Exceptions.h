#pragma once

#include "wavemill/Export.h"

#include <exception>
#include <string>

namespace Corvane::Wavemill {

/// The root of the library's own exceptions. The text for a person is in
/// `message` and is read with getMessage(); what() answers a fixed text,
/// "Application Exception", and never the message. Catch by reference.
class WAVEMILL_API ApplicationException : public std::exception {
public:
  explicit ApplicationException(std::string message);
  ApplicationException(const ApplicationException &other);
  ApplicationException &operator=(const ApplicationException &other);
  ~ApplicationException() override;

  /// "Application Exception".
  const char *what() const noexcept override;
  /// A copy of the text the thrower gave.
  virtual std::string getMessage() const;

  std::string message;
};

/// A failure of the communication with an instrument.
class WAVEMILL_API InstrumentException : public ApplicationException {
public:
  explicit InstrumentException(std::string message);
  InstrumentException(const InstrumentException &other);
  InstrumentException &operator=(const InstrumentException &other);
  ~InstrumentException() override;
};

/// An argument that the operation cannot take. what() answers
/// "Argumen Exception", spelt as it stands: the text is part of the
/// interface and is kept.
class WAVEMILL_API ArgumentException : public ApplicationException {
public:
  explicit ArgumentException(std::string message);
  ArgumentException(const ArgumentException &other);
  ArgumentException &operator=(const ArgumentException &other);
  ~ArgumentException() override;

  /// "Argumen Exception".
  const char *what() const noexcept override;
};

/// An argument outside the range it must lie in, such as a bad index into a
/// collection. what() answers "Argumen Exception".
class WAVEMILL_API ArgumentOutOfRangeException : public ArgumentException {
public:
  explicit ArgumentOutOfRangeException(std::string message);
  ArgumentOutOfRangeException(const ArgumentOutOfRangeException &other);
  ArgumentOutOfRangeException &operator=(const ArgumentOutOfRangeException &other);
  ~ArgumentOutOfRangeException() override;
};

} // namespace Corvane::Wavemill
