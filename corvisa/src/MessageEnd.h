#pragma once

#include <cstddef>
#include <cstdint>

namespace Corvane::Wavemill::CorVisa {

// Finds where a response message ends in a raw byte stream, which has no
// END indicator: at a line feed, except inside the data of a definite-length
// block ("#3100" and 100 bytes), which may hold any byte. A block is seen
// where a response element starts: at the start of the message or after a
// comma outside quotes. With the termination character switched on, every
// such character ends a read as well, blocks included, as VISA does.
//
// The scanner keeps its place across calls, so a block may arrive and be
// read in any pieces.
class MessageEnd {
public:
  enum class Stop { None, End, TermChar };

  // Looks at `data` from the front and stops after the first byte that ends
  // a read. Returns the count looked at (through that byte, or `size`) and
  // sets `stop` to why it stopped.
  std::size_t scan(const unsigned char *data, std::size_t size, Stop &stop);

  // Starts again at the beginning of a message (after a clear).
  void reset();

  void setTermChar(unsigned char termChar, bool enabled);

private:
  enum class State { ElementStart, Text, Quoted, Hash, LengthDigits, BlockData };

  State state = State::ElementStart;
  int digitsLeft = 0;
  std::uint64_t blockLeft = 0;
  unsigned char termChar = '\n';
  bool termCharEnabled = false;
};

} // namespace Corvane::Wavemill::CorVisa
