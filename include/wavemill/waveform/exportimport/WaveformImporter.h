#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/exportimport/WaveformHeader.h"

#include <gsl/span>

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill::ExportImport {

/// Reads the header and the length of a waveform file through a
/// `streamingImporter2`.
///
///     WaveformImporter importer("/data/wave.wv");
///     auto header = importer.getWaveformHeader(); // null when unreadable
///     int64_t samples = importer.getDataLength(); // -1 when not open
///
/// The samples are not read here: `getData` answers -1 by design, and a
/// program that needs them opens the file with a `streamingImporter2` (its
/// one-argument `Open`) or through the flat interface, and reads them in
/// pieces with `GetRawIQData` and `GetMarkers`.
///
/// The file is opened by the constructor, once, when it exists. Failures
/// are answered by -1, an empty vector or a null pointer; the importer's
/// messages stay inside it. A file whose header cannot be read closes this
/// importer for good: after `getHeaderBytes` (or `getWaveformHeader`) has
/// found no header, `getDataLength` and `getMarker` answer -1 too. Damaged
/// bytes never read outside the file's buffers.
///
/// Not copyable. One thread at a time.
class WAVEMILL_API WaveformImporter {
public:
  /// Opens `fileName` (a path in the process's narrow encoding) when it
  /// exists; a missing file is not tried, and leaves the importer closed.
  explicit WaveformImporter(const std::string &fileName);
  /// Closes the file.
  virtual ~WaveformImporter();
  WaveformImporter(const WaveformImporter &) = delete;
  WaveformImporter &operator=(const WaveformImporter &) = delete;

  /// A new record filled from the header bytes, at every call; null when
  /// there are none.
  virtual std::shared_ptr<WaveformHeader> getWaveformHeader();
  /// The header bytes as the exporter received them (at most 1024: a
  /// header must fit the first 1024 bytes of the file); empty when the file
  /// is not open or holds no readable header, which also closes the
  /// importer.
  virtual std::vector<unsigned char> getHeaderBytes();
  /// The samples of the waveform; -1 when not open, 0 when the file holds
  /// no valid header.
  virtual int64_t getDataLength();
  /// Always -1, and `data` is left alone; see the class for reading
  /// samples.
  virtual int getData(gsl::span<unsigned char> data);
  /// -1 when not open. Otherwise 0: the marker bytes are not kept by an
  /// open importer, so nothing is copied, and a size other than the sample
  /// count is refused with 0 as well. Read markers with
  /// `streamingImporter2::GetMarkers`.
  virtual int getMarker(gsl::span<unsigned char> markers);

  struct Impl;

private:
  std::unique_ptr<Impl> impl;
};

} // namespace Corvane::Wavemill::ExportImport
