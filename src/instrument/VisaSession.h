#pragma once

#include "instrument/Visa32Functions.h"
#include "wavemill/Export.h"
#include "wavemill/instrument/VisaIOSession.h"

#include <gsl/span>

#include <atomic>
#include <mutex>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

// The working part of a VisaIOSession: the VISA handles of one resource and
// the transfers over them. It takes no lock itself; VisaIOSession holds
// `mutex` around each call. VISA failures throw ApplicationException with
// the VISA layer's description.
class WAVEMILL_LOCAL VisaIOSession::VisaSession {
public:
  explicit VisaSession(std::string address);

  // Opens the default resource manager, then the resource. Throws
  // ApplicationException when the manager fails and InstrumentException
  // with an empty text when the resource fails; the session stays closed.
  void open();
  // Closes the resource and the manager when open; statuses are not looked
  // at.
  void close();
  // viClear on the resource; the status is not looked at.
  void clear();
  // One answer, bytes as they came, terminator included.
  std::string read();
  // Writes `command` and reads a definite-length block; empty, with the
  // device cleared, when the answer is no block.
  std::vector<unsigned char> readBlock(const std::string &command);
  // Writes `text` and one line feed with the END bit set to `endEnable`.
  void write(const std::string &text, bool endEnable);
  // command + "#" + digit count, then the data, then one 0x00 byte with END.
  void writeBlock(const std::string &command, gsl::span<unsigned char> data);
  // command + "#" + digit count + length, then the first part.
  void writeManyBlocksStart(const std::string &command, gsl::span<unsigned char> firstPart, int totalLength);
  void setSendEndEnable(bool value);
  // The time-out of the resource in milliseconds; false when it cannot be
  // read.
  bool getTimeout(int &timeoutInMS);
  // Sets the time-out of the resource; false when VISA refuses.
  bool setTimeout(int timeoutInMS);
  std::string getAddress() const;

  // True for the two success statuses. Any other status is false, or with
  // `throwOnError` throws ApplicationException with the VISA description.
  static bool checkStatus(int status, bool throwOnError);
  // The resources that match `expression`; empty when VISA fails. Never
  // throws.
  static std::vector<std::string> discover(const std::string &expression);

  std::mutex mutex;
  Visa::ViSession session = 0;
  Visa::ViSession resourceManager = 0;
  std::string address;
  // Both handles are valid. Atomic so that getConnected() may look without
  // the mutex while another thread closes.
  std::atomic<bool> isOpen{false};

private:
  friend class VisaIOSession;

  // Writes `length` bytes in pieces of at most 1024 with END off, and with
  // END set to `endEnable` for the last piece.
  void writeBinary(const unsigned char *data, int length, int blockSize, bool endEnable);
  // viWrite until all `count` bytes are gone; throws on a failing status.
  void writeAll(const unsigned char *data, std::size_t count);
  // viRead of exactly `count` bytes or fewer at the end of the message;
  // returns how many came, throws on a failing status.
  std::size_t readSome(unsigned char *data, std::size_t count);
  void setAttribute(Visa::ViAttr attribute, Visa::ViAttrState value);
  // The attribute's value in its own width, `width` bytes; false on
  // failure.
  bool getAttribute(Visa::ViAttr attribute, std::size_t width, Visa::ViAttrState &value);

  static void *s_visa32Module;
  static Visa32Functions s_visa32;
};

} // namespace Corvane::Wavemill
