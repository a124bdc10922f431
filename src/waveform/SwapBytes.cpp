#include "wavemill/waveform/SwapBytes.h"

namespace Corvane::Wavemill {

namespace {
template <typename T> T swapped(T value, void (*swap)(void *, void *, int)) {
  T result;
  swap(&value, &result, static_cast<int>(sizeof(T)));
  return result;
}
} // namespace

short swapBytes::doit(short value) { return swapped(value, swap_bytes); }
unsigned short swapBytes::doit(unsigned short value) { return swapped(value, swap_bytes); }
int swapBytes::doit(int value) { return swapped(value, swap_bytes); }
unsigned int swapBytes::doit(unsigned int value) { return swapped(value, swap_bytes); }
float swapBytes::doit(float value) { return swapped(value, swap_bytes); }
double swapBytes::doit(double value) { return swapped(value, swap_bytes); }

void swapBytes::swap_bytes(void *src, void *dest, int len) {
  const auto *from = static_cast<const unsigned char *>(src);
  auto *to = static_cast<unsigned char *>(dest);
  for (int i = 0; i < len; ++i) {
    to[i] = from[len - 1 - i];
  }
}

} // namespace Corvane::Wavemill
