#pragma once

#include "wavemill/Export.h"
#include "wavemill/instrument/InstrumentIOSession.h"

#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// The session for instruments behind a VISA library: GPIB, USB, HiSLIP,
/// VXI-11 and every other resource text that VISA opens, such as
/// "GPIB0::7::INSTR" or "TCPIP0::host::hislip0::INSTR".
///
/// The VISA library is not linked. When Wavemill loads, it loads the library
/// named by the environment variable WAVEMILL_VISA_LIBRARY, or else
/// "libcorvisa.so" (found beside libwavemill.so or by the loader's search),
/// and looks up the eleven VISA functions it uses. Without a VISA library a
/// session never connects: connect() is false, the reading and writing of
/// lines and blocks throws, and discover() finds nothing.
///
/// Lines end in one line feed, sent with the END bit. Blocks go out in
/// pieces of at most 1024 bytes. A session stays open after a failed
/// transfer: it throws and leaves closing to the caller.
///
/// Failures: not connected, the line and block reads and writeLine throw
/// `InstrumentException` with texts that name GPIB whatever the bus is. A
/// failure of the VISA layer during a transfer throws `ApplicationException`
/// (not `InstrumentException`) with VISA's description of the status, or
/// "Unknown VISA error".
///
/// Thread safety: each operation holds the session's mutex, so close() from
/// another thread waits for a transfer to end; getConnected() and
/// getAddress() take no lock. The constructor opens nothing.
class WAVEMILL_API VisaIOSession : public InstrumentIOSession {
public:
  /// A session to the VISA resource `address`; not connected.
  explicit VisaIOSession(std::string address);
  /// Closes the session.
  ~VisaIOSession() override;

  /// The resource text as given.
  std::string getAddress() const override;
  /// Whether the resource is open.
  bool getConnected() const override;
  /// The time-out in milliseconds; 6000 at start. While connected it is read
  /// from VISA first (a failed read keeps the stored value); VISA's "wait
  /// for ever" reads as -1.
  int getTimeoutInMS() override;
  /// Stores the time-out and, while connected, gives it to VISA; failures
  /// are swallowed. A negative value waits for ever.
  void setTimeoutInMS(int timeoutInMS) override;
  /// Opens the resource unless it is open and applies the stored time-out;
  /// true when open afterwards. A failure gives false and never throws.
  bool connect() override;
  /// Clears the device (VISA viClear); the outcome is not looked at.
  void clear() override;
  /// Closes the resource and its resource manager; never throws. connect()
  /// may follow.
  void close() override;
  /// Always "": the terminator is fixed.
  std::string getBlockEnd() const override;
  /// Ignores its argument: the terminator is fixed.
  void setBlockEnd(std::string blockEnd) override;
  /// Sends `text` and one line feed with END. Not connected: throws
  /// `InstrumentException` "An I/O error occurred while attempting to write
  /// to GPIB connection <address>". A text of over 300000 bytes raises the
  /// time-out for its transfer to 5 s per full 300000 bytes and restores it.
  void writeLine(const std::string &text) override;
  /// One answer, read in pieces of 1024 bytes, with whatever terminator the
  /// instrument sent. Not connected: throws `InstrumentException` "An I/O
  /// error occurred while attempting to read from GPIB connection
  /// <address>".
  std::string readLine() override;
  /// Sends `command` + "#" + the digit count of the length, with no length
  /// behind it, then the bytes of `data`, then one 0x00 byte with END:
  /// "MMEM:DATA 'a',#1" + 5 bytes + 0x00. The header carries the digit
  /// count only; use writeManyBlocksStart for a header with the length.
  /// Does not test the connection: without one VISA's failure is thrown.
  void writeBlock(const std::string &command, gsl::span<unsigned char> data) override;
  /// Sends `command` + "#" + digit count + `totalLength` (a negative length
  /// counts as 0), then `firstPart`, without END. Does not test the
  /// connection.
  void writeManyBlocksStart(const std::string &command, gsl::span<unsigned char> firstPart, int totalLength) override;
  /// Sends `part` without END. Does not test the connection.
  void writeManyBlocks(gsl::span<unsigned char> part) override;
  /// Sends `command` and reads a definite-length block; the terminator
  /// behind it is read and dropped. An answer that is no block clears the
  /// device and gives an empty vector. Not connected: throws as readLine
  /// does.
  std::vector<unsigned char> readBlock(const std::string &command) override;
  /// Ends a block with one 0x00 byte sent with END. Does not test the
  /// connection.
  void writeManyBlocksEnd() override;

  /// The VISA resources that match `expression`, a VISA pattern such as
  /// "?*INSTR" or "TCPIP?*", in the order VISA lists them; empty when
  /// nothing matches or no VISA library is present. Never throws;
  /// thread-safe as far as the VISA library is.
  static std::vector<std::string> discover(std::string expression);

private:
  class VisaSession;

  int timeoutInMS = 6000;
  std::shared_ptr<VisaSession> session;
};

} // namespace Corvane::Wavemill
