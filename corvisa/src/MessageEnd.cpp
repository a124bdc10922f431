#include "MessageEnd.h"

#include <cstring>

namespace Corvane::Wavemill::CorVisa {

void MessageEnd::reset() {
  state = State::ElementStart;
  blockLeft = 0;
  digitsLeft = 0;
}

void MessageEnd::setTermChar(unsigned char value, bool enabled) {
  termChar = value;
  termCharEnabled = enabled;
}

std::size_t MessageEnd::scan(const unsigned char *data, std::size_t size, Stop &stop) {
  stop = Stop::None;
  std::size_t i = 0;
  while (i < size) {
    if (state == State::BlockData) {
      // Block bytes are skipped in one step: reads of large blocks stay fast.
      std::size_t run = size - i;
      if (blockLeft < run)
        run = static_cast<std::size_t>(blockLeft);
      if (termCharEnabled) {
        const void *found = std::memchr(data + i, termChar, run);
        if (found != nullptr) {
          i = static_cast<std::size_t>(static_cast<const unsigned char *>(found) - data) + 1;
          reset();
          stop = Stop::TermChar;
          return i;
        }
      }
      i += run;
      blockLeft -= run;
      if (blockLeft == 0)
        state = State::Text;
      continue;
    }
    const unsigned char c = data[i++];
    if (termCharEnabled && c == termChar) {
      reset();
      stop = Stop::TermChar;
      return i;
    }
    if (c == '\n') {
      // Also inside quotes: an unbalanced quote must not make reads hang.
      reset();
      stop = Stop::End;
      return i;
    }
    switch (state) {
    case State::ElementStart:
    case State::Text:
      // Responses quote strings with '"' only; a quoted "," or "#" is text.
      if (c == '"') {
        state = State::Quoted;
      } else if (c == ',') {
        state = State::ElementStart;
      } else if (state == State::ElementStart && c == '#') {
        state = State::Hash;
      } else if (state == State::ElementStart && (c == ' ' || c == '\t' || c == '\r')) {
        // Blanks before an element do not start it.
      } else {
        state = State::Text;
      }
      break;
    case State::Quoted:
      if (c == '"')
        state = State::Text;
      break;
    case State::Hash:
      // "#0" is an indefinite block that ends at the line feed; "#H1F" and
      // the like are numbers, not blocks.
      if (c >= '1' && c <= '9') {
        digitsLeft = c - '0';
        blockLeft = 0;
        state = State::LengthDigits;
      } else {
        state = State::Text;
      }
      break;
    case State::LengthDigits:
      if (c < '0' || c > '9') {
        state = State::Text;
        break;
      }
      // At most nine digits: the length stays far below the 64-bit limit.
      blockLeft = blockLeft * 10 + static_cast<std::uint64_t>(c - '0');
      if (--digitsLeft == 0)
        state = blockLeft > 0 ? State::BlockData : State::Text;
      break;
    case State::BlockData:
      break;
    }
  }
  return i;
}

} // namespace Corvane::Wavemill::CorVisa
