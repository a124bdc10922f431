#pragma once

#include "wavemill/Export.h"

#include <gsl/span>

#include <limits>
#include <memory>
#include <string>
#include <unordered_map>

namespace Corvane::Wavemill {

class IInstrument;

/// The record of what is known about one instrument: its address, the
/// identity it gave in answer to "*IDN?", the options it reports and the
/// value ranges noted for settings. An application asks it whether the
/// instrument has the options a function needs and gets a message for the
/// user if not.
///
/// No locks: the object belongs to its `Instrument` and is used by the same
/// one thread. Malformed identities are not errors; they leave isValid()
/// false.
class WAVEMILL_API HardwareResource {
public:
  /// The limits and the step noted for one setting. A new item allows
  /// everything from the smallest positive value of `T` up (for double the
  /// smallest positive normal number, so a negative value clipped against a
  /// default item becomes that tiny positive number) with no step.
  template <class T> struct RangeItem {
    T min = std::numeric_limits<T>::min();
    T max = std::numeric_limits<T>::max();
    T step = T{};
  };

  /// All texts empty, `id` 0, not valid.
  HardwareResource();
  virtual ~HardwareResource();

  /// Asks `instrument` for its identity with "*IDN?" unless this record is
  /// valid for the instrument's address already (compared without regard to
  /// case). An empty answer clears isValid() and keeps the other fields. An
  /// identity of fewer than four comma-separated fields is kept in
  /// getIdentity() with isValid() false; otherwise manufacturer, model,
  /// serial number and firmware are taken from its first four fields
  /// (trimmed of blanks), the options from the instrument's getOptions() and
  /// getExternalOptions(), and the record becomes valid. Exceptions of the
  /// query pass through; a null `instrument` throws std::invalid_argument
  /// ("instrument").
  virtual void updateConnection(std::shared_ptr<IInstrument> instrument);

  /// Whether getOptions() lists `option` (trimmed of blanks); an empty
  /// option is always there. Only the first occurrence in the list is
  /// examined: it must follow the start, a blank or a comma, and it must
  /// either end the list or the list must hold a blank or a comma at the
  /// index of the option's length, counted from the start of the list. So
  /// the last item always holds, and an inner one only at position 0:
  ///
  ///     "B10,B22" has "B22" -> true      "ABC,BC" has "BC" -> false
  ///     "A,BC,D"  has "BC"  -> false     "B10,B1" has "B1"  -> false
  virtual bool has(const std::string &option);

  /// True when `has` holds for one of the comma-separated `options`, or when
  /// `options` is empty.
  bool hasAny(const std::string &options);
  /// True when `has` holds for one of `options`, or when there are none.
  bool hasAny(gsl::span<std::string> options);

  /// Empty when every one of the comma-separated `options` is there;
  /// otherwise a message naming the missing ones for the model number:
  /// "Option B1 is required for SG200." or, for two and more,
  /// "Options B1B2are required for SG200." (see join). With
  /// `throwIfMissing` the message is thrown as InstrumentException instead.
  std::string checkAll(const std::string &options, bool throwIfMissing);
  std::string checkAll(gsl::span<std::string> options, bool throwIfMissing);

  /// Empty when one of the `options` is there or there are none; otherwise
  /// "Option B1is required for SG200." for one option and
  /// "One of the options(B1/B2) is required for SG200." for more. With
  /// `throwIfMissing` the message is thrown as InstrumentException instead.
  std::string checkAny(const std::string &options, bool throwIfMissing);
  std::string checkAny(gsl::span<std::string> options, bool throwIfMissing);

  /// The parts for a message: after the second part to the last but two
  /// ", ", after the last but one "and ", nothing after the first.
  /// {A, B} -> "AB", {A, B, C} -> "ABand C", {A, B, C, D} -> "AB, Cand D".
  static std::string join(gsl::span<std::string> parts);

  /// A copy of the address.
  std::string getAddress() const;
  /// Takes `address` unless it equals the present one without regard to
  /// case (then even the stored case stays). A new address clears isValid()
  /// and the model number; the other identity fields stay until the next
  /// updateConnection.
  void setAddress(const std::string &address);

  /// Clears isValid(), the identity fields, the options and getData();
  /// address and ranges stay.
  void clearData();

  /// Whether the identity fields describe the instrument at the address.
  bool isValid() const;
  /// The whole answer to "*IDN?".
  std::string getIdentity() const;
  std::string getManufacturer() const;
  std::string getModelNumber() const;
  std::string getSerialNumber() const;
  std::string getFirmwareRevision() const;
  /// The option list, comma or blank separated.
  std::string getOptions() const;
  /// The list of external options.
  std::string getExtOptions() const;
  void setIdentity(std::string identity);
  void setManufacturer(std::string manufacturer);
  void setModelNumber(std::string modelNumber);
  void setSerialNumber(std::string serialNumber);
  void setFirmwareRevision(std::string firmwareRevision);
  void setOptions(std::string options);
  void setExtOptions(std::string extOptions);

  /// Free text and a free number for the application; never written here.
  std::string getDescription() const;
  void setDescription(std::string description);
  int getId() const;
  void setId(int id);

  /// The ranges noted by setting name, as `Instrument::clip` keeps them. The
  /// reference lives as long as this object.
  std::unordered_map<std::string, RangeItem<double>> &getRanges();
  const std::unordered_map<std::string, RangeItem<double>> &getRanges() const;
  /// Key-value data for the application; emptied by clearData().
  std::unordered_map<std::string, std::string> &getData();
  const std::unordered_map<std::string, std::string> &getData() const;

protected:
  std::string address;
  std::string description;
  int id = 0;
  bool valid = false;
  std::string identity;
  std::string manufacturer;
  std::string modelNumber;
  std::string serialNumber;
  std::string firmwareRevision;
  std::string options;
  std::string extOptions;
  // Two texts for derived classes; this class leaves them empty.
  std::string reservedText1;
  std::string reservedText2;
  std::unordered_map<std::string, RangeItem<double>> ranges;
  std::unordered_map<std::string, std::string> data;

private:
  // setAddress("") and clearData(): forgets everything but the ranges.
  void clear();
};

} // namespace Corvane::Wavemill
