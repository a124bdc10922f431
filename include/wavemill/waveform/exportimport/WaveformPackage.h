#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/exportimport/IWaveformPackage.h"

#include <memory>
#include <string>

namespace Corvane::Wavemill::ExportImport {

/// Writes a waveform file through a `streamingExporter2` (16-bit IQ, known
/// length) under the header of its `WaveformHeader` record.
///
///     WaveformPackage package;
///     package.setFileName("/data/wave.wv");
///     package.getWaveformHeader()->tag5 = "sine";
///     package.begin(1000, true);
///     package.append(iqChunk);          // 4 bytes a sample, big-endian
///     package.appendMarker(markerChunk); // 1 byte a sample
///     ...
///     package.end();                    // markers joined behind the IQ
///
/// Each `begin` makes a new exporter on the file name as it stands then,
/// which creates or empties the file; the exporter of an earlier `begin` is
/// released, and its file stays as far as it was written. The markers wait
/// in the file name + "_mkr" beside the target until `end`.
///
/// Results: the append operations answer false only before the first
/// `begin`, and true otherwise, whatever the exporter made of the chunk. A
/// target that cannot be written still gives true everywhere; the exporter
/// then removes what it wrote, so no file is left (see `Exporter2`). The
/// float operations write through the same 16-bit exporter: this class
/// makes no floating-point exporter.
///
/// Not copyable. One thread at a time; the header record is shared with the
/// caller without a lock.
class WAVEMILL_API WaveformPackage : public IWaveformPackage {
public:
  /// A package with no file name, no header record and no exporter.
  WaveformPackage();
  /// Releases the exporter; a file not ended stays incomplete.
  ~WaveformPackage() override;
  WaveformPackage(const WaveformPackage &) = delete;
  WaveformPackage &operator=(const WaveformPackage &) = delete;

  /// The name of the file the next `begin` writes; empty at first.
  const std::string &getFileName() const;
  /// Names the file of the next `begin`; a run already begun keeps its file.
  void setFileName(const std::string &fileName);

  /// Makes the record at the first call (every field at its default);
  /// afterwards the same shared record. Never null.
  std::shared_ptr<WaveformHeader> getWaveformHeader() override;
  /// Creates the file under the header as the record stands now (a default
  /// record is made if none was asked for) and starts a run of `samples`
  /// samples. False, and nothing made, when the file name is empty; true
  /// otherwise, also when the exporter refuses the run (negative
  /// `samples`) or the file cannot be written.
  bool begin(int64_t samples, bool hasMarkers) override;
  /// Writes the IQ bytes (a multiple of 4 for whole samples; the bytes of a
  /// partial sample go with the next chunk). The chunk that reaches the
  /// declared length ends the IQ data. False before `begin`.
  bool append(std::shared_ptr<std::vector<unsigned char>> iq) override;
  /// As the vector form.
  bool append(gsl::span<unsigned char> iq) override;
  /// Writes packed marker bytes into the marker file; call it after the
  /// first `append`, which writes the file head. False before `begin`.
  bool appendMarker(std::shared_ptr<std::vector<unsigned char>> markers) override;
  /// As the vector form.
  bool appendMarker(gsl::span<unsigned char> markers) override;
  /// Asks the current exporter to start a run of `samples` samples. False
  /// when there is no exporter (on a new package); true otherwise, even
  /// though an exporter begun by `begin` refuses a second start.
  bool beginFloat(int64_t samples, bool hasMarkers) override;
  /// As `append`.
  bool appendFloat(std::shared_ptr<std::vector<unsigned char>> iq) override;
  /// As `append`.
  bool appendFloat(gsl::span<unsigned char> iq) override;
  /// As `appendMarker`.
  bool appendFloatMarker(std::shared_ptr<std::vector<unsigned char>> markers) override;
  /// As `appendMarker`.
  bool appendFloatMarker(gsl::span<unsigned char> markers) override;
  /// Appends the marker file to the target and deletes it. Does nothing
  /// before `begin`.
  void end() override;

  struct Impl;

private:
  std::unique_ptr<Impl> impl;
};

} // namespace Corvane::Wavemill::ExportImport
