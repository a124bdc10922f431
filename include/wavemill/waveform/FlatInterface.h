#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/StreamingExporter2.h"
#include "wavemill/waveform/StreamingImporter2.h"

#include <cstdint>
#include <memory>
#include <string>

/// The flat block interface: plain functions over the streaming exporter and
/// importer, for programs that do not share this library's classes. Every
/// function takes an opaque handle first and tolerates a null one.
///
/// The exporter functions are exported under their plain C names
/// (`CreateBlockExporter`, `start`, `stream`, ...); the importer functions
/// under their C++ names, which carry the signature (on Linux
/// `_Z4OpenP14CBlockImporterPwPh` for `Open`, and so on).
///
/// Writing: `CreateBlockExporter`; `start`; `stream`, or `streamiq` and
/// `streammarker`, per chunk; `stop`; `DisposeExporter`.
///
/// Reading: `CreateBlockImporter`; `GetKey`; `Open` with the masked file key
/// formed from the answer of `GetKey` (see `FormMaskedFileKey`);
/// `GetHeaderLen`; `GetHeader`; `GetDataLen`; `GetData` and `GetMarkers` in
/// pieces; `close`; `DisposeImporter`.
///
/// The file key: a caller forms the masked key from
/// `Corvane::Wavemill::fixedFileKey`, the 16-byte constant of
/// wavemill/waveform/EncryptKey.h, with `FormMaskedFileKey` below. Both are
/// defined in the headers, so the key comes with the headers a program is
/// compiled with, and the library exports no function that hands it out.
///
/// Errors of the importer stay in its error text, which no function here
/// returns. A handle belongs to one thread at a time.

/// A streaming exporter behind the flat interface; it adds nothing to
/// `streamingExporter2`.
class WAVEMILL_API CBlockExporter : public streamingExporter2 {
public:
  /// Writes to `fileName` with the serialized header `header` of
  /// `headerLen` bytes, as `streamingExporter2`.
  CBlockExporter(const std::string &fileName, unsigned char *header, int headerLen);
};

/// The handle of the importer functions: owns one `streamingImporter2`.
class WAVEMILL_API CBlockImporter {
public:
  /// Creates the importer; the three arguments are not used. Throws
  /// `std::bad_alloc` when the importer cannot be allocated.
  CBlockImporter(unsigned char *unused1, int unused2, unsigned char *unused3);
  /// Deletes the importer.
  ~CBlockImporter();
  CBlockImporter(const CBlockImporter &) = delete;
  CBlockImporter &operator=(const CBlockImporter &) = delete;

  /// The importer; null only when a caller has released it.
  std::unique_ptr<streamingImporter2> importer;
};

/// Writes into `key` (16 bytes) the masked file key for `Open`: byte i of
/// `fixedFileKey` XORed with byte i % 4 of `keyMask`, least significant
/// first. `keyMask` is the answer of `GetKey`.
inline void FormMaskedFileKey(int keyMask, unsigned char *key) {
  const auto mask = static_cast<unsigned int>(keyMask);
  for (int n = 0; n < 16; ++n) {
    key[n] = Corvane::Wavemill::fixedFileKey[n] ^ static_cast<unsigned char>(mask >> (8 * (n % 4)));
  }
}

extern "C" {

/// A new exporter writing to `fileName` (a narrow path) with the header of
/// `headerLen` bytes (a shorter or null header counts as padded with zeros
/// to 16). Null when allocation fails or `fileName` is null. Free it with
/// `DisposeExporter`.
WAVEMILL_API CBlockExporter *CreateBlockExporter(const char *fileName, unsigned char *header, int headerLen);
/// Destroys the exporter; null does nothing.
WAVEMILL_API void DisposeExporter(CBlockExporter *exporter);
/// Starts a waveform of `samples` samples (known length). False for a null
/// handle, or when the exporter has started or finished.
WAVEMILL_API bool start(CBlockExporter *exporter, int64_t samples, bool hasMarkers);
/// Finishes a waveform written with `streamiq` and `streammarker`: appends
/// the markers. Null does nothing.
WAVEMILL_API void stop(CBlockExporter *exporter);
/// Writes a chunk of `samples` samples: `iq` holds 4 big-endian bytes per
/// sample (I then Q), `markers` one packed byte per sample. `last` ends the
/// waveform. False for a null handle or before `start`.
WAVEMILL_API bool stream(CBlockExporter *exporter, unsigned char *iq, unsigned char *markers, int samples, bool last);
/// Writes `bytes` IQ bytes (4 per sample). False for a null handle or
/// before `start`.
WAVEMILL_API bool streamiq(CBlockExporter *exporter, unsigned char *iq, int bytes);
/// Writes `bytes` packed marker bytes; IQ must come first. False for a null
/// handle.
WAVEMILL_API bool streammarker(CBlockExporter *exporter, unsigned char *markers, int bytes);

} // extern "C"

/// A new importer handle, or null when allocation fails. Free it with
/// `DisposeImporter`.
WAVEMILL_API CBlockImporter *CreateBlockImporter();
/// Deletes the importer, then the handle; null does nothing.
WAVEMILL_API void DisposeImporter(CBlockImporter *importer);
/// Draws a key mask (see `streamingImporter2::GetKey`); 0 for a null handle.
WAVEMILL_API int GetKey(CBlockImporter *importer);
/// Opens the file at `path` with the masked key `key` (16 bytes, changed in
/// place). False for a null handle or a file that cannot be opened; the
/// handle stays usable for another `Open`.
WAVEMILL_API bool Open(CBlockImporter *importer, wchar_t *path, unsigned char *key);
/// The header length in bytes; -1 before `Open` and for a null handle.
WAVEMILL_API int GetHeaderLen(CBlockImporter *importer);
/// Copies the header; `size` must be `GetHeaderLen`. Answers `size`, 0 on a
/// wrong size or before `Open`, -1 for a null handle.
WAVEMILL_API int GetHeader(CBlockImporter *importer, unsigned char *dest, unsigned int size);
/// The samples of the waveform; 0 before `Open`, -1 for a null handle.
WAVEMILL_API int64_t GetDataLen(CBlockImporter *importer);
/// Reads the next `size` IQ bytes (see `streamingImporter2::GetRawIQData`);
/// -1 for a null handle. A size above 2^31 - 1 reads nothing. Throws the
/// int -1 when the file ends inside the blocks it needs.
WAVEMILL_API int GetData(CBlockImporter *importer, unsigned char *dest, unsigned int size);
/// Reads the next `size` packed marker bytes; -1 for a null handle.
WAVEMILL_API int GetMarkers(CBlockImporter *importer, unsigned char *dest, unsigned int size);
/// 0 for 16-bit IQ, 1 for floating IQ; -1 for a null handle.
WAVEMILL_API int GetWavformFormatFlag(CBlockImporter *importer);
/// Closes the file; null does nothing.
WAVEMILL_API void close(CBlockImporter *importer);
