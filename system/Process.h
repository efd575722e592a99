#pragma once

#include <functional>

namespace tarn {

/// What a service process sets up before anything else, on the main thread.
///
/// From now on the signals that ask for an end (SIGTERM, SIGINT, SIGHUP) wait for endOnStopSignals(), in
/// every thread that is made later, and SIGPIPE does nothing.
void prepareSignals();

/// Starts the thread on which a stop signal calls `beforeEnd` and ends the process with status 0, at once:
/// nothing is destroyed, whatever the other threads are doing.
void endOnStopSignals(std::function<void()> beforeEnd);

/// Allows as many open files as the system lets this process have: every mirrored asset keeps one.
void raiseFileLimit();

/// Lets the heap keep little of what was freed. By itself it takes a big block that was freed as the sign
/// that more will come, and one hostile frame would cost the process up to 16 MiB for as long as it lives.
void returnFreedMemory();

} // namespace tarn
