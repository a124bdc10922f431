#pragma once

#include "wavemill/Export.h"

#include <gsl/span>

#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

/// The one transport interface of the instrument layer: an `Instrument`
/// speaks SCPI through a session and never knows which transport lies
/// behind it. `LanIOSession` is a raw TCP socket, `VisaIOSession` a VISA
/// library loaded at run time; `create` picks one from the form of an
/// address.
///
/// A session is used by one thread at a time; callers that share one
/// serialise their use themselves. Failures follow the transport: a
/// session that is not connected throws `InstrumentException`, a failure
/// on a live connection is the transport's to report (see each class).
class WAVEMILL_API InstrumentIOSession {
public:
  /// Does nothing; a session touches the network only in connect().
  InstrumentIOSession();
  virtual ~InstrumentIOSession();
  InstrumentIOSession(const InstrumentIOSession &) = delete;
  InstrumentIOSession &operator=(const InstrumentIOSession &) = delete;

  /// The address the session was built with.
  virtual std::string getAddress() const = 0;
  /// The session's connected flag.
  virtual bool getConnected() const = 0;
  /// Time-out of each transfer, in milliseconds.
  virtual int getTimeoutInMS() = 0;
  /// Sets the time-out, in milliseconds, for the transfers to come.
  virtual void setTimeoutInMS(int timeoutInMS) = 0;
  /// Opens the transport; true if connected afterwards.
  virtual bool connect() = 0;
  /// Clears the device's I/O state, where the transport has such a thing.
  virtual void clear() = 0;
  /// Closes the transport; the session may connect again.
  virtual void close() = 0;
  /// The terminator sent after lines and blocks.
  virtual std::string getBlockEnd() const = 0;
  /// Sets the terminator, where the transport lets it be chosen.
  virtual void setBlockEnd(std::string blockEnd) = 0;
  /// Sends one command line with its terminator.
  virtual void writeLine(const std::string &text) = 0;
  /// Reads one response, without its terminator.
  virtual std::string readLine() = 0;
  /// Sends `command`, then `data` as an IEEE 488.2 definite-length block,
  /// then the terminator. Nothing is put between `command` and "#".
  virtual void writeBlock(const std::string &command, gsl::span<unsigned char> data) = 0;
  /// Opens a definite-length block of `totalLength` bytes and sends its
  /// first part. The caller guarantees that the parts add up.
  virtual void writeManyBlocksStart(const std::string &command, gsl::span<unsigned char> firstPart,
                                    int totalLength) = 0;
  /// Sends a further part of the block opened by writeManyBlocksStart.
  virtual void writeManyBlocks(gsl::span<unsigned char> part) = 0;
  /// Sends `command` and reads a definite-length block as the answer; empty
  /// when the answer is no block or the transfer failed.
  virtual std::vector<unsigned char> readBlock(const std::string &command) = 0;
  /// Sends the terminator that closes the block.
  virtual void writeManyBlocksEnd() = 0;

  // query and queryArray are virtual so that every implementation shares
  // one slot order, but both are written here once, on top of the virtual
  // operations above, and no transport overrides them.

  /// writeLine(command), then readLine(). No lock, no retry; failures are
  /// those of the two operations.
  virtual std::string query(const std::string &command);
  /// The bytes of the block that readBlock(command) answers, as the
  /// characters of a text: raw, zero bytes included, not parsed. A block of
  /// 3 zero bytes gives a text of length 3.
  virtual std::string queryArray(const std::string &command);

  /// The session for `address`, not yet connected; empty for an empty
  /// address. The form of the address picks the transport, case-insensitive:
  ///
  ///     192.168.0.5, a host name, GPIB0     LAN, port 5025
  ///     TCPIP0::host::6000::SOCKET          LAN, host, port 6000
  ///     TCPIP0::host::INSTR, TCPIP0::host   LAN, port 5025
  ///     TCPIP0::host::inst0::INSTR          VISA
  ///     TCPIP0::host::hislip0::INSTR        VISA
  ///     USB..., GPIB0::7::INSTR, ASRL1::INSTR and any other "::" text  VISA
  ///
  /// A port of digits that does not fit an int throws std::out_of_range
  /// ("stoi argument out of range").
  static std::shared_ptr<InstrumentIOSession> create(std::string address);
};

} // namespace Corvane::Wavemill
