#pragma once

#include "wavemill/Export.h"

#include <cstdint>
#include <memory>

/// Reads an encrypted waveform file: recovers the data key from the 32-byte
/// file head, walks the tagged packages and keeps the header.
///
/// This base class reads from memory and opens nothing (`Open` answers
/// false); `streamingImporter2` is the form that opens files and reads the
/// IQ data and markers piece by piece. A file is laid out as
///
///     32-byte head (under fixedFileKey) | tag 1: header from byte 16 |
///     tag 2 (16-bit IQ) or tag 4 (floating IQ) | tag 3: packed markers
///
/// each package being tag and length (big-endian words), the body and zeros
/// up to a whole 16-byte block, encrypted under the data key.
///
/// Failures never throw here: an operation answers 0 (-1 or false where
/// told) and leaves a message in the importer's error text, which derived
/// classes read with `lastError()`. Before a header package has been read
/// every operation answers as for an invalid file with "Error: Invalid
/// Waveform data and waveform information".
///
/// The importer owns every buffer and file handle it holds. One thread at a
/// time; not copyable.
class WAVEMILL_API Importer2 {
public:
  /// An importer with nothing open and an empty error text.
  Importer2();
  /// Frees the buffers and closes every file still open.
  virtual ~Importer2();
  Importer2(const Importer2 &) = delete;
  Importer2 &operator=(const Importer2 &) = delete;

  /// Opens the file at `path` with the masked file key `key` (16 bytes).
  /// The base class opens nothing and answers false.
  virtual bool Open(const wchar_t *path, unsigned char *key);
  /// Copies the `samples` decoded I and Q values, scaled to -1..1. `samples`
  /// must equal `GetIQDataLen()`; otherwise 0 and "Error: Incorrect buffer
  /// size: need buffer size <count>, input buffer size <samples>". Answers
  /// the samples copied, 0 when there are no decoded values.
  virtual int GetIQData(double *i, double *q, int samples);
  /// Copies the IQ package body: `size` must equal 4 * `GetIQDataLen()`
  /// (the same message as `GetIQData` when not). Answers `size`.
  virtual int GetRawIQData(unsigned char *dest, int size);
  /// Unpacks the markers: `count` must equal `GetIQDataLen()`, and `dest`
  /// receives 4 * `count` bytes, one per marker and sample, each 0 or 1 (bit
  /// 0 of a packed byte first). A wrong count gives 0 and "Error: Incorrect
  /// number of marker samplea: total samples is <n> but requested is
  /// <count>". Answers `count`.
  virtual int GetMarkers(unsigned char *dest, int count);
  /// Copies `count` packed marker bytes (bit c is marker c + 1); `count`
  /// must equal `GetIQDataLen()` ("Error: Incorrect number of marker sample:
  /// total samples <n> requested <count>"). Answers the bytes copied, 0 when
  /// no marker package is held (as after a streaming `Open`).
  virtual int GetRawMarkers(unsigned char *dest, int count);
  /// Copies the header as the exporter received it: its first 16 bytes from
  /// the file head, the rest from the header package. `size` must equal
  /// `GetHeaderLength()`; otherwise 0 and "Error: Incorrect size of header
  /// data: total size<body length> size requested <size>" (the total given
  /// without the 16 head bytes). Answers `size`.
  virtual int GetHeader(unsigned char *dest, int size);

  /// The header length in bytes (package body plus 16), or -1.
  int GetHeaderLength();
  /// The samples of the IQ package: its length divided by 4 (tag 2) or by
  /// 8 (tag 4); 0 when no header has been read. With a wrong key this is
  /// whatever the noise says.
  std::int64_t GetIQDataLen();
  /// Stores in `count` the markers per sample (4 once a file is open) and
  /// answers true, or false before a header has been read.
  bool GetNMarker(int &count);
  /// 0 for 16-bit IQ (tag 2), 1 for floating IQ (tag 4).
  int GetWavformFormatFlag();
  /// Copies up to `len` bytes of the IQ package body held in memory and
  /// answers the bytes copied.
  int GetDataPtr(void *dest, int len);
  /// Closes the file handles; the buffers stay until the next opening.
  void close();

protected:
  /// Closes what is open, opens `path` twice for reading (IQ and markers)
  /// and resets the state of a file. False, with "Failed to open the
  /// file.", when either opening fails.
  bool openInit(const wchar_t *path);
  /// Decrypts `len` bytes read from the start of the file: the head with
  /// `key` (unmasked in place), then whole blocks under the data key into
  /// the staging area, walking the packages as it fills. Answers the bytes
  /// consumed.
  int runDecrypter(unsigned char *data, int len, unsigned char *key);
  /// Walks the decrypted bytes in the staging area: collects package bodies
  /// and reads the prefixes at package boundaries. 0, or -1 when a body
  /// cannot be stored.
  int flush();
  /// Stores the collected body of the package just ended by its tag.
  void saveDecryptedData();
  /// Decrypts the file head in the staging area under `key`, unmasked with
  /// the current key mask, and switches to the data key.
  void unPackageBaseHeader(unsigned char *key);
  /// Turns `samples` big-endian 16-bit IQ pairs at `raw` into values scaled
  /// to -1..1, adding extra resolution when a residual width is set.
  void extractData(unsigned char *raw, double *i, double *q, int samples);
  /// Adds `samples` residual values from the residual files to `i` and `q`.
  void addResBits(double *i, double *q, int samples);
  /// Frees the package buffers and the decoded values.
  void clear();

  /// The message of the last failure; empty when none.
  const char *lastError() const;
  /// Bytes per extra-resolution value stored behind the markers (1, 2 or
  /// 4); 0, the default, means the file has none.
  void setResidualWidth(int bytes);

  struct Impl;
  /// The state of this importer and of `streamingImporter2`.
  std::unique_ptr<Impl> impl;
};
