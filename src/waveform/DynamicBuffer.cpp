#include "wavemill/waveform/DynamicBuffer.h"

#include <cstring>
#include <new>

namespace Corvane::Wavemill {

DynamicBuffer::DynamicBuffer(int blockSize)
    : blockSize(blockSize < 0 ? 0 : blockSize), totalSize(0), first(nullptr), last(nullptr) {
  first = getNewBlock();
  if (first == nullptr) {
    throw std::bad_alloc();
  }
  last = first;
}

DynamicBuffer::~DynamicBuffer() { deleteDynBuf(first); }

int DynamicBuffer::append(unsigned char *src, int len) {
  if (len < 0 || len > blockSize || (src == nullptr && len > 0)) {
    return 0;
  }
  if (last->used + len > blockSize) {
    // A piece is never split: the rest of the old block stays unused.
    dynBufBlk *block = getNewBlock();
    if (block == nullptr) {
      return 0;
    }
    last->next = block;
    last = block;
  }
  if (len > 0) {
    std::memcpy(last->data + last->used, src, static_cast<std::size_t>(len));
  }
  last->used += len;
  totalSize += len;
  return len;
}

int DynamicBuffer::copyTo(unsigned char *dest) {
  if (dest == nullptr) {
    return 0;
  }
  int copied = 0;
  for (dynBufBlk *block = first; block != nullptr; block = block->next) {
    if (block->used > 0) {
      std::memcpy(dest + copied, block->data, static_cast<std::size_t>(block->used));
      copied += block->used;
    }
  }
  return copied;
}

void DynamicBuffer::reset() {
  dynBufBlk *fresh = getNewBlock();
  if (fresh == nullptr) {
    // Without a fresh block the old chain is kept, emptied, so that there
    // is always a block to append to.
    deleteDynBuf(first->next);
    first->next = nullptr;
    first->used = 0;
    last = first;
  } else {
    deleteDynBuf(first);
    first = last = fresh;
  }
  totalSize = 0;
}

int DynamicBuffer::size() { return totalSize; }

dynBufBlk *DynamicBuffer::getNewBlock() {
  auto *block = new (std::nothrow) dynBufBlk{nullptr, 0, nullptr};
  if (block == nullptr) {
    return nullptr;
  }
  block->data = new (std::nothrow) unsigned char[static_cast<std::size_t>(blockSize)];
  if (block->data == nullptr) {
    delete block;
    return nullptr;
  }
  return block;
}

void DynamicBuffer::deleteDynBuf(dynBufBlk *block) {
  // The chain is freed last block first, but by turning it around instead
  // of recursing: a long package has a chain far deeper than the stack.
  dynBufBlk *reversed = nullptr;
  while (block != nullptr) {
    dynBufBlk *next = block->next;
    block->next = reversed;
    reversed = block;
    block = next;
  }
  while (reversed != nullptr) {
    dynBufBlk *next = reversed->next;
    delete[] reversed->data;
    delete reversed;
    reversed = next;
  }
}

} // namespace Corvane::Wavemill
