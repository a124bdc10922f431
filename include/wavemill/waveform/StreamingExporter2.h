#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/Exporter2.h"

#include <cstdint>
#include <string>

/// The chunk-by-chunk writing shared by `streamingExporter2` and
/// `streamingFloatExporter2`; use one of those two.
///
/// IQ chunks are encrypted straight onto the end of the target file. The
/// marker package must follow the whole IQ package, so marker chunks are
/// encrypted into the file `fileName + "_mkr"` beside the target and
/// appended to it at the end; since every block is encrypted on its own,
/// the blocks can simply be joined. The package prefix goes out with the
/// first chunk of a package and carries the declared length; the bytes
/// behind a chunk's last whole block are held back for the next chunk of
/// the same package, and only the last chunk is padded.
///
/// Data arrive in file form: big-endian 16-bit IQ (I hi, I lo, Q hi, Q lo)
/// or the caller's floating IQ, and one packed marker byte per sample (bit
/// c is marker c + 1). Nothing is normalised.
///
/// A known-length run: `start(samples, hasMarkers)`, then `stream` per chunk
/// with `last` on the final one, or `streamiq` and `streammarker` per chunk
/// (IQ first: the first call delivers the file head) and then `stop()`.
///
///     streamingExporter2 exporter("/data/wave.wv", header, headerLen);
///     exporter.start(100, true);
///     exporter.stream(iq, markers, 60, false);       // iq: 240 bytes
///     exporter.stream(iq + 240, markers + 60, 40, true);
///
/// The unknown-length mode (`start(hasMarkers)`) buffers the chunks raw in
/// `fileName + "_tmp"`, but its replay reads no chunk back: the target
/// stays at 0 bytes and the raw file is deleted at the end. Applications
/// rely on this and must use the known-length mode to get a waveform.
///
/// Failures: bad arguments (a negative count, a null pointer with a
/// positive count) are refused with false and change nothing. When a write
/// fails (a folder that does not exist or is not writable, a full disk)
/// the results stay as documented, but the target and the "_mkr" and
/// "_tmp" files are removed, nothing more is written and `failed()` is
/// true: after a failure a caller finds none of the three files. A run
/// abandoned before its last chunk leaves the target incomplete and the
/// "_mkr" file beside it; a later `start` does not empty an old "_mkr" of
/// `streamingExporter2`, whose blocks then get appended too.
///
/// One thread per exporter. Two exporters on one target share the
/// temporary files and spoil each other's output.
class WAVEMILL_API StreamingExporterBase : public Exporter2 {
public:
  ~StreamingExporterBase() override;

  /// Starts a run of `samples` samples; with `hasMarkers` false no marker
  /// count is expected from `streammarker`. False when a run was started or
  /// finished, in unknown-length mode, or for negative `samples`.
  bool start(int64_t samples, bool hasMarkers) override;
  /// Starts the unknown-length mode (see the class). False when it was
  /// started already.
  bool start(bool hasMarkers) override;
  /// After `streamiq`/`streammarker` pairs: appends the "_mkr" file to the
  /// target and deletes it. Does nothing more after a `stream` with `last`.
  void stop() override;
  /// Writes `samples` samples: `samples * 4` IQ bytes from `iq` (also in the
  /// float exporter) and `samples` marker bytes from `markers`, which are
  /// written even without `hasMarkers`; null `markers` are written as
  /// zeros. With `last` the markers are appended and the file is complete.
  /// False before `start` and for bad arguments, with nothing written.
  bool stream(unsigned char *iq, unsigned char *markers, int samples, bool last) override;
  /// Writes `bytes` IQ bytes (4 a sample, 8 in the float exporter); the
  /// chunk that reaches the declared length ends the IQ package. False
  /// before `start` and for bad arguments. More bytes than declared are
  /// written as they come; the length word stays as declared.
  bool streamiq(unsigned char *iq, int bytes) override;
  /// Encrypts `bytes` packed marker bytes into the "_mkr" file; needs a
  /// `start` first for that name, and a `streamiq` first, since the first
  /// delivery of a file carries its head. False only for bad arguments.
  bool streammarker(unsigned char *markers, int bytes) override;

protected:
  /// `floatIq` chooses the IQ package: tag 4 with 8 bytes a sample, or
  /// tag 2 with 4.
  StreamingExporterBase(const std::string &fileName, unsigned char *header, int headerLen, bool floatIq);

  /// The declared length of the IQ or marker package in progress.
  int64_t getPkgSize() override;
  /// As `Exporter2::readBlocks`, but a pass ends with the chunk in hand:
  /// only the header package moves on to the next one.
  int readBlocks(unsigned char *dest, int blocks) override;
  /// The float exporter's order of packages: header, IQ (state 4), markers.
  void getNextPackager() override;
  /// The package state (plus 32 on the last chunk) the first time a state
  /// is packaged; afterwards 16, or 32 on the last chunk.
  int pkgTag() override;
  /// Also removes the "_mkr" and "_tmp" files.
  void discardOutput() override;

  bool started = false;
  bool unknownLength = false;
  int64_t totalSamples = 0;
  bool hasMarkers = false;
  bool lastChunk = false;
  int64_t iqRemaining = 0;
  int64_t markerRemaining = 0;
  std::string markerTempName;
  std::string rawTempName;

private:
  void streamRawKnownWave();
  void streamUnknown(unsigned char *iq, unsigned char *markers, int samples);
  void streamUnknown(unsigned char *iq, int bytes);
  void streamUnknownMarker(unsigned char *markers, int bytes) const;
  void appendMarkerFile();
  unsigned int iqState() const { return floatIq ? 4 : 2; }

  const bool floatIq;
};

/// Writes a waveform of 16-bit IQ (package tag 2) chunk by chunk; see
/// `StreamingExporterBase`. Its `start(samples, hasMarkers)` leaves an old
/// "_mkr" file beside the target in place.
class WAVEMILL_API streamingExporter2 : public StreamingExporterBase {
public:
  /// As `Exporter2`: creates or empties the target.
  streamingExporter2(const std::string &fileName, unsigned char *header, int headerLen);
};

/// Writes a waveform of floating IQ (package tag 4, 8 bytes a sample, kept
/// exactly as given) chunk by chunk; see `StreamingExporterBase`. Its
/// `start(samples, hasMarkers)` empties the "_mkr" file. `stream` takes 4
/// bytes a sample like the integer exporter; send 8 a sample with `streamiq`.
class WAVEMILL_API streamingFloatExporter2 : public StreamingExporterBase {
public:
  /// As `Exporter2`: creates or empties the target.
  streamingFloatExporter2(const std::string &fileName, unsigned char *header, int headerLen);
};
