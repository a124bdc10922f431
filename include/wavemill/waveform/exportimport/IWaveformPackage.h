#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/exportimport/WaveformHeader.h"

#include <gsl/span>

#include <cstdint>
#include <memory>
#include <vector>

namespace Corvane::Wavemill::ExportImport {

/// Writes one waveform file chunk by chunk under a header taken from a
/// `WaveformHeader`; the interface through which applications export.
///
/// Call order: fill the record of `getWaveformHeader()`; `begin`; `append`
/// and `appendMarker` per chunk, IQ first; `end`. Data arrive in file form:
/// big-endian 16-bit IQ, 4 bytes a sample (I hi, I lo, Q hi, Q lo), and one
/// packed marker byte per sample (bit c is marker c + 1). Nothing is
/// normalised.
///
/// Operations report only by their bool result; what happens to the file
/// is told by the implementation. One thread at a time.
class WAVEMILL_API IWaveformPackage {
public:
  /// The header record the file is written under; the same shared record
  /// at every call, never null.
  virtual std::shared_ptr<WaveformHeader> getWaveformHeader() = 0;
  /// Starts a new file of `samples` samples, with or without markers.
  virtual bool begin(int64_t samples, bool hasMarkers) = 0;
  /// Writes a chunk of IQ bytes; a null pointer is an empty chunk.
  virtual bool append(std::shared_ptr<std::vector<unsigned char>> iq) = 0;
  /// Writes a chunk of IQ bytes.
  virtual bool append(gsl::span<unsigned char> iq) = 0;
  /// Writes a chunk of packed marker bytes; a null pointer is an empty chunk.
  virtual bool appendMarker(std::shared_ptr<std::vector<unsigned char>> markers) = 0;
  /// Writes a chunk of packed marker bytes.
  virtual bool appendMarker(gsl::span<unsigned char> markers) = 0;
  /// Starts a run of floating-point data on the file begun last.
  virtual bool beginFloat(int64_t samples, bool hasMarkers) = 0;
  /// Writes a chunk of IQ bytes of a floating run.
  virtual bool appendFloat(std::shared_ptr<std::vector<unsigned char>> iq) = 0;
  /// Writes a chunk of IQ bytes of a floating run.
  virtual bool appendFloat(gsl::span<unsigned char> iq) = 0;
  /// Writes a chunk of marker bytes of a floating run.
  virtual bool appendFloatMarker(std::shared_ptr<std::vector<unsigned char>> markers) = 0;
  /// Writes a chunk of marker bytes of a floating run.
  virtual bool appendFloatMarker(gsl::span<unsigned char> markers) = 0;
  /// Finishes the file: the markers are appended behind the IQ data.
  virtual void end() = 0;
  /// Releases the writer; a file not ended stays incomplete.
  virtual ~IWaveformPackage() = default;
};

} // namespace Corvane::Wavemill::ExportImport
