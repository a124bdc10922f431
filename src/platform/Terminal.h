#pragma once

namespace Corvane::Wavemill::Platform {

// The three streams every process starts with.
enum class StandardStream { Input, Output, Error };

// True when `stream` is connected to a terminal, so that a program may draw
// on it (a progress bar, say); false for a file, a pipe or a closed stream.
bool isTerminal(StandardStream stream);

} // namespace Corvane::Wavemill::Platform
