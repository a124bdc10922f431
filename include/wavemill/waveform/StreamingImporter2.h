#pragma once

#include "wavemill/Export.h"
#include "wavemill/waveform/Importer2.h"

/// Reads a waveform file of any length piece by piece with small buffers.
///
/// `Open` learns everything it needs from the first 1024 bytes of the file:
/// the head, the whole header package and the prefix of the IQ package must
/// lie inside them (with a longer header `GetIQDataLen()` stays 0). After
/// that, IQ data and markers are read through two handles on the same file,
/// so IQ and marker reads may be interleaved. Reads of any size are rounded
/// to whole 16-byte blocks and the decrypted surplus is kept for the next
/// read of the same kind, so each handle reads the file once, in order.
///
///     streamingImporter2 importer;
///     unsigned char key[16];
///     FormMaskedFileKey(static_cast<int>(importer.GetKey()), key);  // FlatInterface.h
///     importer.Open(L"/data/wave.wv", key);    // or Open(path), which does both
///     importer.GetRawIQData(buffer, 1 << 20);  // the first MiB of IQ bytes
///
/// The key is not checked: a wrong one decrypts to noise, and the lengths
/// read from it mean nothing (reads then stop at the end of the file).
/// Reads keep a quirk of the format's first readers: a read that the kept
/// surplus can serve alone copies it, answers 0 and does not use it up,
/// although the samples left fall. Reads of 16 bytes or more always go to
/// the file. One thread at a time.
class WAVEMILL_API streamingImporter2 : public Importer2 {
public:
  streamingImporter2();
  ~streamingImporter2() override;

  /// Opens `path` with the masked file key `key` (16 bytes, unmasked in
  /// place with the mask of the last `GetKey()`, or used as it is before
  /// any). False with "Failed to open the file." when the file cannot be
  /// opened, and false when it is empty or `key` is null. A wrong key or
  /// a file of another format still opens; `GetIQDataLen()` then tells.
  bool Open(const wchar_t *path, unsigned char *key) override;
  /// Draws a new key mask from the time-seeded `rand()` and answers it: the
  /// caller masks the file key with its four bytes, least significant
  /// first. Uses the process-wide `srand`.
  virtual unsigned int GetKey();
  /// Opens `path` with a key mask and masked key made here.
  virtual bool Open(const wchar_t *path);
  /// Reads up to `samples` IQ pairs as 16-bit values. Answers the bytes
  /// fetched divided by 4 (0 at the end). Throws the int -1 as
  /// `GetRawIQData` does.
  virtual int GetIQData(short *i, short *q, int samples);
  /// Reads up to `samples` IQ pairs scaled to -1..1; answers as the 16-bit
  /// form.
  int GetIQData(double *i, double *q, int samples) override;
  /// Reads the next `size` bytes of the IQ package body, cut to what
  /// remains (4 bytes per sample, 8 for floating IQ). Answers `size` as cut,
  /// or 0 when nothing was read from the file. Throws the int -1 when the
  /// file ends inside the blocks it needs.
  int GetRawIQData(unsigned char *dest, int size) override;
  /// Reads the next `count` packed marker bytes (one per sample, bit c is
  /// marker c + 1), cut to what remains; answers as `GetRawIQData`. Blocks
  /// missing at the end of the file read as zero bytes.
  int GetMarkers(unsigned char *dest, int count) override;

private:
  void GenKey(unsigned int maskWord, unsigned char *out);
};
