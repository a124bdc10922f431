#pragma once

#include "wavemill/Export.h"

namespace Corvane::Wavemill {

/// One block of a `DynamicBuffer`'s chain: `blockSize` bytes of which the
/// first `used` are filled. The buffer owns `data` and the next block.
struct dynBufBlk {
  unsigned char *data;
  int used;
  dynBufBlk *next;
};

/// A growing store of bytes made of chained blocks of one size.
///
/// What is stored is never moved or copied again when the store grows, so a
/// package of unknown length can be collected piece by piece. Each append
/// lands whole inside one block: a piece that does not fit the rest of the
/// current block opens a new one and leaves that rest unused, and a piece
/// longer than a block is refused.
///
///     DynamicBuffer b(4);
///     b.append(abc, 3);     // 3: block 1 holds "abc"
///     b.append(defg, 4);    // 4: does not fit after "abc", block 2 holds "defg"
///     b.append(big, 5);     // 0: longer than a block, nothing stored
///     b.copyTo(out);        // 7: "abcdefg", the unused byte is not copied
///
/// Not copyable: it owns its blocks. Allocation failure of the first block
/// throws `std::bad_alloc`; later failures make `append` return 0.
class WAVEMILL_API DynamicBuffer {
public:
  /// A buffer with one empty block of `blockSize` bytes; a negative size
  /// counts as 0, which refuses every non-empty append.
  explicit DynamicBuffer(int blockSize);
  /// Frees every block.
  virtual ~DynamicBuffer();
  DynamicBuffer(const DynamicBuffer &) = delete;
  DynamicBuffer &operator=(const DynamicBuffer &) = delete;

  /// Stores `len` bytes from `src` and returns `len`. Returns 0 and stores
  /// nothing when `len` exceeds the block size, is negative, `src` is null
  /// with `len` above 0, or a new block cannot be allocated.
  int append(unsigned char *src, int len);
  /// Copies the stored bytes, block after block, to `dest`, which must hold
  /// `size()` bytes. Returns the bytes copied, 0 when `dest` is null.
  int copyTo(unsigned char *dest);
  /// Frees every block and starts again with one empty block.
  void reset();
  /// The bytes stored.
  int size();

private:
  dynBufBlk *getNewBlock();
  void deleteDynBuf(dynBufBlk *block);

  int blockSize;
  int totalSize;
  dynBufBlk *first;
  dynBufBlk *last;
};

} // namespace Corvane::Wavemill
