#pragma once

#include "wavemill/Export.h"
#include "wavemill/instrument/InstrumentIOSession.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill {

/// The session that talks SCPI over one raw TCP connection, by default to
/// port 5025 of the instrument. Lines and blocks end in "\n\r" (line feed
/// first) unless setBlockEnd says otherwise.
///
/// Failures: only the operations that need a connection and find none throw
/// `InstrumentException`. A failure on a live connection never throws: a
/// failed send closes the connection and clears the connected flag, a
/// failed read yields an empty result (readLine also logs "WSA error " and
/// the error number at level 3 to the channel "Log"). So after a failure the
/// next operation throws, or the caller sees getConnected() go false, and
/// connect() may be called again for a new socket.
///
/// Reading: readLine looks only at the end of each received piece of up to
/// 8192 bytes. A piece that ends in a line feed, carriage return or zero byte
/// ends the answer; a full piece of 8192 bytes is kept and reading goes on; a
/// shorter piece without such an end is dropped, because an instrument's
/// answer ends its packet. Several lines in one piece come back as one text.
/// The length digits and the body of a block in readBlock are each one
/// receive that waits for the whole count within the time-out, so a large
/// block that arrives in many TCP segments is read whole; a block that has
/// not fully come when the time-out ends is a failed transfer.
///
/// Sending: block data go out straight from the caller's span, without a
/// copy. Each piece (a line, a block header, the data, the terminator) is
/// sent whole, however many system calls that takes; one that fails or does
/// not finish within the time-out is a failed send.
///
/// Not thread-safe: one thread at a time per session. Each session holds one
/// start of the socket library for its lifetime. The constructor does not
/// touch the network, so a wrong host name shows only in connect().
class WAVEMILL_API LanIOSession : public InstrumentIOSession {
public:
  /// A session to `address` (host name or IPv4 text) and TCP `port`; not
  /// connected.
  LanIOSession(std::string address, int port);
  /// Closes the socket.
  ~LanIOSession() override;

  /// The host the session was built with.
  std::string getAddress() const override;
  /// The TCP port the session connects to.
  int getPort() const;
  bool getConnected() const override;
  /// Send and receive time-out, and the limit of the connection attempt, in
  /// milliseconds; 6000 at start.
  int getTimeoutInMS() override;
  /// Stores the time-out and, when connected, applies it to the socket at
  /// once. 0 or less: transfers wait without limit and connect() does not
  /// wait for the handshake.
  void setTimeoutInMS(int timeoutInMS) override;

  /// Resolves the host and connects; true when the session counts as
  /// connected. Already connected: true at once, the line is not checked.
  /// Refused or failed within the time-out: false. The handshake is awaited
  /// for the whole seconds of the time-out only (500 ms: not at all); when it
  /// has not finished by then the session still counts as connected, and the
  /// first transfer shows whether the instrument is there. An empty address
  /// or a host that does not resolve: false.
  bool connect() override;
  /// Nothing: a raw socket has no device state to clear.
  void clear() override;
  /// Closes the socket and clears the connected flag; connect() may follow.
  void close() override;
  /// "\n\r" at start.
  std::string getBlockEnd() const override;
  void setBlockEnd(std::string blockEnd) override;

  /// Sends `text` + the terminator. Not connected: throws
  /// `InstrumentException` "Failed to send SCPI <text> to <address>".
  void writeLine(const std::string &text) override;
  /// One answer without its trailing carriage returns and line feeds (see
  /// the class comment); empty on a time-out or a closed connection. Not
  /// connected: throws `InstrumentException` "An I/O error occurred while
  /// attempting to read from TCP/IP connection <address>".
  std::string readLine() override;
  /// Sends `command` + "#" + digit count + length, the bytes of `data`, then
  /// the terminator: "MMEM:DATA 'a',#15" + 5 bytes + "\n\r". An empty `data`
  /// gives the empty block "#10". Not connected: throws
  /// `InstrumentException` "Connection error."; a failed header send also
  /// prints "Server: send() error <errno>." to standard output.
  void writeBlock(const std::string &command, gsl::span<unsigned char> data) override;
  /// Sends the header for `totalLength` bytes (a negative length counts as
  /// 0) and `firstPart`. Not connected: throws `InstrumentException`
  /// "Connection error.".
  void writeManyBlocksStart(const std::string &command, gsl::span<unsigned char> firstPart, int totalLength) override;
  /// Sends `part`. Does not test the connection: without one the send fails,
  /// the flag is cleared and nothing is thrown.
  void writeManyBlocks(gsl::span<unsigned char> part) override;
  /// Sends `command` and reads a definite-length block. Empty, with the
  /// connection closed, when the transfer fails or the answer is no block
  /// (the rest of the answer is then read and thrown away until the other
  /// side closes or the time-out ends), or when the length digits are no
  /// number or exceed an int. A digit count or length of 0 reads and drops
  /// one line and gives an empty block with the connection kept. The
  /// terminator behind a block stays unread. Not connected: throws as
  /// readLine does.
  std::vector<unsigned char> readBlock(const std::string &command) override;
  /// Sends the terminator. Does not test the connection, as writeManyBlocks.
  void writeManyBlocksEnd() override;

  /// The address to connect to for `address`: a dotted text of four numbers
  /// as it stands (the numbers are not checked), otherwise the first IPv4
  /// address the name resolves to, else its first IPv6 address, else "".
  /// "localhost" -> "127.0.0.1". Thread-safe.
  static std::string getIPAddress(const std::string &address);

private:
  struct Impl;
  std::unique_ptr<Impl> impl;
};

} // namespace Corvane::Wavemill
