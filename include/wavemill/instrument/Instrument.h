#pragma once

#include "wavemill/Export.h"
#include "wavemill/instrument/HardwareResource.h"
#include "wavemill/instrument/IInstrument.h"

#include <gsl/span>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

class DoubleSetting;
class InstrumentIOSession;
class Setting;

/// The SCPI client object. It owns a `HardwareResource` with the address and
/// identity of the device and a session (`InstrumentIOSession`) that it
/// builds from that address, opens on the first operation and gives up on
/// disconnect(). Applications derive their instrument classes from it and
/// override getOptions(), getExternalOptions() and checkConnection().
///
/// Failures follow one rule. Argument faults throw std::invalid_argument
/// with the argument's name. An empty address throws std::runtime_error
/// ("The instrument address is empty."). Otherwise, with `throwOnError` set
/// (the default) a session that will not connect throws std::runtime_error
/// ("Failed to send SCPI " + command + " to " + address), and a failure
/// during a transfer throws std::runtime_error with the caught exception's
/// what() and the command in parentheses; since what() of the library's own
/// exceptions is "Application Exception", that reads
/// "Application Exception(*IDN?)". Without `throwOnError` both end the
/// operation quietly with its empty result ("", 0.0, no bytes, false).
///
/// Nothing confirms that a command worked: no error queue, no "*OPC?", no
/// status clear is sent. There is no lock and no thread; an instrument is
/// used by one thread at a time. Each operation holds its own reference to
/// the session, so setIOSession() cannot free a session under a call.
class WAVEMILL_API Instrument : public IInstrument {
public:
  /// No address and no session; time-out 20000 ms, throws on errors.
  Instrument();
  /// Sets the address and prepares a session for it (see doConnect); no
  /// byte goes over the wire yet. A socket address with a port of digits
  /// that does not fit an int throws std::out_of_range.
  explicit Instrument(std::string address);
  /// Disconnects; never throws.
  ~Instrument() override;
  Instrument(const Instrument &) = delete;
  Instrument &operator=(const Instrument &) = delete;

  /// "Instrument".
  std::string toString() const override;
  /// The address kept by the hardware resource.
  std::string getAddress() const override;
  /// Changes the address of the hardware resource; the present session is
  /// left as it is until the next connect().
  void setAddress(const std::string &address) override;
  /// doConnect().
  bool connect() override;
  /// Closes a connected session and drops it; always true.
  bool disconnect() override;

  /// Sends removeBrackets(command). When the first word ends in "?" the
  /// command is a query, and its answer is read and dropped.
  void send(const std::string &command) override;
  /// Sends removeBrackets(command) and answers the response, line feeds
  /// trimmed from both ends. `timeoutInMS` -1 means the instrument's
  /// time-out; 0 opens the connection with the instrument's time-out and
  /// then gives the session 0, which a LAN session takes as no limit.
  /// Below -1 throws std::invalid_argument ("timeoutInMS").
  std::string query(const std::string &command, int timeoutInMS) override;
  /// Empty here; a derived class asks its device.
  std::string getOptions() override;
  /// Empty here; a derived class asks its device.
  std::string getExternalOptions() override;

  /// The next response of an open session with the given time-out, line
  /// feeds trimmed; empty when there is no open session. Session exceptions
  /// pass through unchanged.
  virtual std::string readLine(int timeoutInMS);
  /// Sends `data` as a definite-length block behind a header made from
  /// `command` (trimmed of blanks): a bare header gets a blank, a header
  /// with parameters a comma unless it ends in one already:
  ///
  ///     "MMEM:DATA 'a'" + 5 bytes -> MMEM:DATA 'a',#15<bytes>
  ///     "SYST:DATA"     + 5 bytes -> SYST:DATA #15<bytes>
  ///
  /// Data longer than `maxBlockSize` (at least 4096) go out over a LAN
  /// session in parts of 4096 bytes; the bytes on the wire are the same.
  virtual void sendBlock(const std::string &command, gsl::span<unsigned char> data, int maxBlockSize);
  /// Sends `command` as it stands and reads a definite-length block as the
  /// answer. `timeoutInMS` 0 means the instrument's time-out; -1 is given to
  /// the session as it is (no limit for a LAN session). Below -1 throws
  /// ArgumentOutOfRangeException ("timeoutInMS").
  virtual std::vector<unsigned char> queryBlock(const std::string &command, int timeoutInMS);
  /// The raw bytes of the block that `command` (sent as it stands) answers,
  /// as text with line feeds trimmed from both ends. An empty command throws
  /// std::invalid_argument ("query").
  virtual std::string queryArray(const std::string &command);
  /// Sends the header, a blank and `value` with six decimal places whatever
  /// the process's locale: ("FREQ", 1.5) -> "FREQ 1.500000".
  virtual void sendNumber(const std::string &command, double value);
  /// The number at the start of query(command, -1), so that a unit behind it
  /// does no harm; 0.0 for an empty or unreadable answer.
  virtual double queryNumber(const std::string &command);
  /// Sends "HEADER value" only when the instrument's answer to "HEADER?"
  /// differs, and tells whether it sent. Numbers (both texts begin with a
  /// sign or a digit) compare by value, so "1E9" equals "+1.00000000E+009";
  /// other texts are the same when `value` begins with the answer, bytes
  /// compared exactly, so a value VOLTAGE matches the short answer VOLT but
  /// not "volt". Other than two words throws std::invalid_argument
  /// ("command"); an empty answer throws std::invalid_argument
  /// ("The SCPI command is incorrrect.").
  virtual bool sendIfDifferent(const std::string &command);

  /// Closes a connected session, then builds an unconnected session for the
  /// address (true) or drops it when the address is empty (false).
  bool doConnect();
  /// Puts in `session` (which may be empty) in place of the present one,
  /// which is not closed.
  void setIOSession(std::shared_ptr<InstrumentIOSession> session);
  /// The record of address, identity, options and ranges; shared, never
  /// null unless a derived class made it so.
  std::shared_ptr<HardwareResource> getHardwareResource() const;

  /// `command` with the optional-node brackets dropped from its header, the
  /// part before the first blank; brackets in parameters stay.
  /// "[SOUR1:]FREQ[:CW] 1E9" -> "SOUR1:FREQ:CW 1E9",
  /// "MMEM:NAME 'a[1]'" -> unchanged.
  static std::string removeBrackets(std::string command);

  /// Clips the value of `setting` to the range noted under its name (see
  /// HardwareResource::RangeItem), noting a default range first if there is
  /// none; with `step`, that step instead of the noted one. A null setting
  /// is left alone.
  void clip(const std::shared_ptr<DoubleSetting> &setting);
  void clip(const std::shared_ptr<DoubleSetting> &setting, double step);
  /// Clips the value of `setting` to [min, max] (and `step`), noting a
  /// default range under its name if there is none. The limits are used once
  /// and not noted.
  void setAndClip(const std::shared_ptr<DoubleSetting> &setting, double min, double max);
  void setAndClip(const std::shared_ptr<DoubleSetting> &setting, double min, double max, double step);
  /// Clips the value of `setting` to the limits that `instrument` answers to
  /// header + "? MIN" and header + "? MAX", asked in that order. A null
  /// setting is left alone and nothing is asked; a null instrument throws
  /// std::invalid_argument ("instrument").
  void queryAndClip(const std::shared_ptr<DoubleSetting> &setting, const std::shared_ptr<Instrument> &instrument,
                    const std::string &header);

protected:
  /// The gate before every operation: throws when the address is empty,
  /// builds a session through connect() if there is none, sets its time-out
  /// (`timeoutInMS` if above 0, else the field) and opens it. False, or
  /// std::runtime_error with `throwOnError`, when it does not open.
  virtual bool checkConnection(std::string command, int timeoutInMS);

  /// Default time-out of every operation, in milliseconds.
  int timeoutInMS = 20000;
  /// A failed operation throws if set; otherwise it ends with an empty result.
  bool throwOnError = true;
  /// Each operation disconnects when it ends.
  bool disconnectAfterUse = false;
  std::shared_ptr<HardwareResource> hardwareResource;
  std::shared_ptr<InstrumentIOSession> session;

private:
  // Runs `calls` on the present session under the operation's rules:
  // disconnects afterwards when asked, and turns a failure into the thrown
  // std::runtime_error or into false.
  bool guarded(const std::string &command, const std::function<void(InstrumentIOSession &)> &calls);
  HardwareResource::RangeItem<double> getOrCreate(const std::shared_ptr<Setting> &setting);
};

} // namespace Corvane::Wavemill
