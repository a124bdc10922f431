#pragma once

#include "wavemill/Export.h"
#include "wavemill/instrument/InstrumentIOSession.h"

#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// The session for instruments behind a VISA library: GPIB, USB, HiSLIP,
/// VXI-11 and every other resource text that VISA opens, such as
/// "GPIB0::7::INSTR" or "TCPIP0::host::hislip0::INSTR". The VISA library is
/// not linked; VISA resources are reached once a VISA library is present.
/// Without one, a session never connects: connect() and getConnected() are
/// false, the reading and writing of lines and blocks throws
/// `InstrumentException`, and the other operations do nothing.
///
/// The terminator of this transport is fixed and not chosen by the caller.
/// The messages name GPIB whatever the bus is. The constructor opens
/// nothing. One thread at a time per session.
class WAVEMILL_API VisaIOSession : public InstrumentIOSession {
public:
  /// A session to the VISA resource `address`; not connected.
  explicit VisaIOSession(std::string address);
  ~VisaIOSession() override;

  /// The resource text as given.
  std::string getAddress() const override;
  /// False while no VISA library is present.
  bool getConnected() const override;
  /// The time-out in milliseconds; 6000 at start.
  int getTimeoutInMS() override;
  /// Stores the time-out for the connection to come.
  void setTimeoutInMS(int timeoutInMS) override;
  /// False while no VISA library is present; never throws.
  bool connect() override;
  /// Nothing while not connected.
  void clear() override;
  /// Nothing while not connected.
  void close() override;
  /// Always "": the terminator is fixed.
  std::string getBlockEnd() const override;
  /// Ignores its argument: the terminator is fixed.
  void setBlockEnd(std::string blockEnd) override;
  /// Not connected: throws `InstrumentException` "An I/O error occurred
  /// while attempting to write to GPIB connection <address>".
  void writeLine(const std::string &text) override;
  /// Not connected: throws `InstrumentException` "An I/O error occurred
  /// while attempting to read from GPIB connection <address>".
  std::string readLine() override;
  /// Nothing while not connected.
  void writeBlock(const std::string &command, gsl::span<unsigned char> data) override;
  /// Nothing while not connected.
  void writeManyBlocksStart(const std::string &command, gsl::span<unsigned char> firstPart, int totalLength) override;
  /// Nothing while not connected.
  void writeManyBlocks(gsl::span<unsigned char> part) override;
  /// Not connected: throws as readLine does.
  std::vector<unsigned char> readBlock(const std::string &command) override;
  /// Nothing while not connected.
  void writeManyBlocksEnd() override;

  /// The VISA resources that match `expression` (such as "?*INSTR"); empty
  /// while no VISA library is present. Never throws.
  static std::vector<std::string> discover(std::string expression);

private:
  int timeoutInMS = 6000;
  std::string address;
};

} // namespace Corvane::Wavemill
