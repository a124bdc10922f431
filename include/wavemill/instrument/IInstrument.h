#pragma once

#include "wavemill/Export.h"
#include "wavemill/models/IObject.h"

#include <string>

namespace Corvane::Wavemill {

/// What an application needs of an instrument it talks SCPI to: an address,
/// a connection, commands and queries, and the options it reports.
/// `Instrument` is the implementation; code that only sends and asks, such
/// as `HardwareResource::updateConnection`, takes this interface.
///
/// An instrument is used by one thread at a time. Failures are the
/// implementation's to define; `Instrument` throws std::runtime_error or
/// ends quietly with an empty result, by its `throwOnError`.
class WAVEMILL_API IInstrument : public IObject {
public:
  ~IInstrument() override;

  /// The address the instrument is reached at, such as
  /// "TCPIP0::192.168.0.5::5025::SOCKET"; empty when none is set.
  virtual std::string getAddress() const = 0;
  /// Sets the address used by the next connection; an open connection is
  /// left as it is.
  virtual void setAddress(const std::string &address) = 0;
  /// Prepares the connection to the address; true when there is one to use.
  virtual bool connect() = 0;
  /// Ends the connection; true when it is gone.
  virtual bool disconnect() = 0;
  /// Sends one command. A query sent by mistake has its answer read and
  /// dropped, so that no answer is left waiting.
  virtual void send(const std::string &command) = 0;
  /// Sends a query and answers the response line without its line feeds.
  /// `timeoutInMS` -1 uses the instrument's own time-out.
  virtual std::string query(const std::string &command, int timeoutInMS) = 0;
  /// The instrument's option list, comma or blank separated; empty unless a
  /// derived class asks its device.
  virtual std::string getOptions() = 0;
  /// The options of external equipment attached to the instrument; empty
  /// unless a derived class asks its device.
  virtual std::string getExternalOptions() = 0;
};

} // namespace Corvane::Wavemill
