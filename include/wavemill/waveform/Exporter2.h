#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/DataReader.h"
#include "wavemill/waveform/Encryptor.h"
#include "wavemill/waveform/Packager.h"

#include <cstdint>
#include <memory>
#include <string>

/// Writes one encrypted arbitrary-waveform file from header bytes, IQ
/// samples and markers; the abstract base of the streaming exporters.
///
/// The file, from its first byte (all numbers big-endian):
///
/// | Offset  | Size               | Content                                      | Key            |
/// |---------|--------------------|----------------------------------------------|----------------|
/// | 0       | 32                 | header bytes 0-7, salt, 8-15, salt           | `fixedFileKey` |
/// | 32      | 8 + H - 16, padded | package 1: the header from byte 16 on        | data key       |
/// | follows | 8 + 4n, padded     | package 2: 16-bit IQ, I hi, I lo, Q hi, Q lo | data key       |
/// | follows | 8 + n, padded      | package 3: one marker byte per sample        | data key       |
///
/// Packages are framed and padded to 16 bytes as `WPL_Packager` tells; a
/// floating-point IQ package has tag 4 and 8 bytes a sample. The data key is
/// `EncryptKey::generateKey` of the 32 plain head bytes, so a reader derives
/// it from the head alone. Each salt is the low bytes of eight `rand()`
/// results after `srand(time)`, seeded anew for each, so both are equal unless
/// the clock ticks in between, and exporters made within one second share
/// them. This reseeds the process-wide `rand()`.
///
/// The file is created (or emptied) by the constructor; the head and the
/// packages follow in 1024-byte writes as the data come, and the encrypted
/// file never exists whole in memory.
///
/// Failures: allocation failure throws `std::bad_alloc`. If the target
/// cannot be created or a write fails (a folder that does not exist or is
/// not writable, a full disk), the results stay as they would have been,
/// but the exporter removes what it wrote, writes nothing more and
/// `failed()` turns true: after a failure a caller finds no target file.
///
/// One thread per exporter; exporters on one target collide.
class WAVEMILL_API Exporter2 {
public:
  /// Prepares the file `fileName` with the serialized waveform header of
  /// `headerLen` bytes at `header` (copied). A header is at least 16 bytes;
  /// a shorter one (or a null one) is taken as padded with zeros to 16.
  Exporter2(const std::string &fileName, unsigned char *header, int headerLen);
  /// Frees the buffers, the encryptor, the reader and the packagers; the
  /// file stays as written.
  virtual ~Exporter2();
  Exporter2(const Exporter2 &) = delete;
  Exporter2 &operator=(const Exporter2 &) = delete;

  /// Starts an export of `samples` samples of known length; see the
  /// streaming exporters.
  virtual bool start(int64_t samples, bool hasMarkers) = 0;
  /// Starts an export of unknown length; see the streaming exporters.
  virtual bool start(bool hasMarkers) = 0;
  /// Ends an export.
  virtual void stop() = 0;
  /// Writes one chunk of IQ data and markers in file form.
  virtual bool stream(unsigned char *iq, unsigned char *markers, int samples, bool last) = 0;
  /// Writes IQ bytes in file form.
  virtual bool streamiq(unsigned char *iq, int bytes) = 0;
  /// Writes packed marker bytes.
  virtual bool streammarker(unsigned char *markers, int bytes) = 0;

  /// Writes the whole waveform: I and Q (`samples` values each) are scaled
  /// together so that the largest magnitude becomes full scale, rounded to
  /// 16 bits (1.0 -> 32767, -1.0 -> -32767; all-zero input stays zero), and
  /// `markerCount` bytes per sample at `markers` set the marker bits (byte c
  /// of a sample not 0 sets bit c, for c < 4; further bytes are skipped).
  /// `markers` may be null when `markerCount` is 0.
  /// Returns false, writing nothing, when a waveform was already written
  /// and for bad arguments: negative counts, null I or Q with samples,
  /// null markers with `markerCount` above 0, or more than 2^29 - 1
  /// samples. Otherwise true, also when the file could not be written
  /// (see `failed()`).
  bool setData(double *i, double *q, unsigned char *markers, int samples, int markerCount);

  /// True once the target could not be created or a write failed; the
  /// target and any temporary files have then been removed.
  bool failed() const { return writeFailed; }

protected:
  /// The declared length of the package in progress; 0 lets each package
  /// state the length of its reader.
  virtual int64_t getPkgSize();
  /// Scales `i` and `q` (`n` values each) by their common peak magnitude
  /// into `outI` and `outQ`. With a peak of 0 the outputs are left alone.
  /// NaN values do not count toward the peak.
  virtual void normalize(const double *i, const double *q, double *outI, double *outQ, int n);
  /// Encrypts up to `blocks` blocks of the package stream into `dest` and
  /// returns how many came; moves on to the next package when one ends.
  virtual int readBlocks(unsigned char *dest, int blocks);
  /// Replaces the reader and the packager by those of the next package,
  /// or marks the export finished after the markers.
  virtual void getNextPackager();
  /// The tag handed to the next packager: the package state here.
  virtual int pkgTag();

  /// Normalises, quantises and stores samples and markers as `setData`
  /// describes; false for bad arguments, with nothing changed.
  bool convertData(double *i, double *q, unsigned char *markers, int samples, int markerCount);
  /// Copies `samples * 4` IQ bytes and `samples` marker bytes as they are.
  /// Null `markers` give zero markers; false for negative `samples`, null
  /// `iq` with samples, or more than 2^29 - 1 samples, with nothing changed.
  bool convertData(unsigned char *iq, unsigned char *markers, int samples);
  /// One scaled sample value as stored: +-0.5 then truncated toward zero
  /// (unless `truncateSamples`), keeping the low 16 bits. NaN gives 0.
  short round(double value) const;
  /// Seeds `rand()` with the time in seconds and fills `len` bytes at
  /// `dest` with the low bytes of its results.
  void addSalt(unsigned char *dest, int len);
  /// Builds the 32 plain head bytes from the first 16 bytes of `header`
  /// into `dest`, and rewinds the head to be delivered.
  void packageBase(unsigned char *dest, const unsigned char *header);
  /// Takes ownership of `previous` (may be null), passes its held-back
  /// bytes to a new packager of `reader`, and deletes it.
  void startPackager(Corvane::Wavemill::WPL_Packager *previous);
  /// Starts the next packager of the chain whose last packager is `chain`
  /// (`iqPackager` or `markerPackager`) and stores it back there.
  void continueChain(std::unique_ptr<Corvane::Wavemill::WPL_Packager> &chain);
  /// Delivers up to `size` bytes of the encrypted file into `dest`: the
  /// pending head first, then whole blocks, an odd remainder through a
  /// one-block spill. Returns the bytes delivered; 0 once finished.
  uint64_t readEncryptedData(unsigned char *dest, uint64_t size);
  /// Appends the encrypted stream up to the end of the current pass to
  /// `path`. The pass runs even when nothing can be written, so the package
  /// states move on; a failed write calls `discardOutput()`.
  void appendEncryptedData(const std::string &path);
  /// Removes the target and marks the export failed; derived classes
  /// remove their temporary files too.
  virtual void discardOutput();

  unsigned int truncateSamples = 0;
  std::string fileName;
  std::string unusedName1;
  std::string unusedName2;
  int iqSize = 0;
  int markerSize = 0;
  int headerLen = 0;
  std::unique_ptr<unsigned char[]> iqData;
  std::unique_ptr<unsigned char[]> markerData;
  std::unique_ptr<unsigned char[]> headerData;
  std::unique_ptr<Corvane::Wavemill::Encryptor> encryptor;
  Corvane::Wavemill::WPL_Packager *packager = nullptr; // one of the two chains below, or null
  std::unique_ptr<Corvane::Wavemill::WPL_Packager> iqPackager;
  std::unique_ptr<Corvane::Wavemill::WPL_Packager> markerPackager;
  std::unique_ptr<Corvane::Wavemill::DataReader> reader;
  bool finished = false;
  std::unique_ptr<unsigned char[]> fileBuffer;
  std::unique_ptr<unsigned char[]> headBuffer;
  int headPos = 0;
  int headEnd = 0;
  unsigned int pkgState = 0;
  bool tagWritten[5] = {};
  bool writeFailed = false;
  std::unique_ptr<char[]> streamBuffer; // stdio buffer of the file being appended to
};
