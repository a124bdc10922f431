#pragma once

namespace Corvane::Wavemill::Platform {

// The end of a program that runs in the foreground until its user stops it
// with Ctrl-C or a service manager sends SIGTERM.
//
// blockTerminationSignals() must come first, before the program starts any
// thread: threads inherit the mask, so the signals are held for
// waitForTerminationSignal() instead of ending the process on whichever
// thread the system picks. False when the mask cannot be set.
bool blockTerminationSignals();

// Waits until SIGINT or SIGTERM arrives and returns its number; -1 when the
// signals were not blocked first or the wait fails.
int waitForTerminationSignal();

} // namespace Corvane::Wavemill::Platform
