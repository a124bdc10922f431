#pragma once

#include "wavemill/Export.h"

namespace Corvane::Wavemill {

class DynamicBuffer;

/// A sink of bytes that `FileHeader::write` pushes a header into.
///
/// Nothing throws: failures are told by 0 and false results.
class WAVEMILL_API DataWriter {
public:
  /// Releases the writer.
  virtual ~DataWriter();
  /// Stores `size * count` bytes from `src`. Returns the number of items
  /// stored (what `FileHeader::write` expects), 0 on failure.
  virtual int write(const void *src, int size, int count) = 0;
  /// Discards what was written so far; a header calls it before writing.
  virtual void reset() = 0;
  /// Whether anything can be written at all.
  virtual bool isValid() = 0;
  /// Finishes after the last write of a header; false on failure.
  virtual bool close() = 0;
};

/// Collects bytes in a `DynamicBuffer` that it does not own.
///
/// The class stays abstract: `write(const void *, int, int)` and `close()`
/// are the caller's to implement, so a header is only written through a
/// writer of the caller's own. Such a writer usually forwards to the
/// `write(void *, int, int)` below.
class WAVEMILL_API Buffer_DataWriter : public DataWriter {
public:
  /// Writes into `buffer`, which must outlive the writer; null gives a
  /// writer that is not valid.
  explicit Buffer_DataWriter(DynamicBuffer *buffer);
  /// Empties the buffer.
  void reset() override;
  /// True when the buffer is not null.
  bool isValid() override;
  using DataWriter::write;
  /// Appends `size * count` bytes as one piece and returns `count`. Returns
  /// 0 when the buffer is null or refuses the piece (longer than its block
  /// size, see `DynamicBuffer::append`), and for an empty or negative piece.
  virtual int write(void *src, int size, int count);
  /// The bytes held by the buffer, 0 when it is null.
  virtual int size();

protected:
  DynamicBuffer *buffer;
};

} // namespace Corvane::Wavemill
