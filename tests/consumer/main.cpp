// Proves that an installed Wavemill can be found, compiled against and linked:
// a prototype fetched twice is the same object.
#include "wavemill/wavemill.h"

#include <iostream>

int main() {
  using Corvane::Wavemill::Prototype;
  const auto first = Prototype::getInstance<int>();
  const auto second = Prototype::getInstance<int>();
  *first = 42;
  if (first != second || *second != 42) {
    std::cerr << "wavemill consumer: prototypes differ\n";
    return 1;
  }
  std::cout << "wavemill consumer: prototype of int is shared, value " << *second << "\n";
  return 0;
}
