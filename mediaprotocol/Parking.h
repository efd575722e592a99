#pragma once

#include "system/FileDescriptor.h"

namespace tarn {

/// A file is parked by sending it into a socket whose other end nobody reads: it is in flight then, and
/// belongs to no process. Whoever holds the other end and lets it go drops the file without a wait, whatever
/// its file system does, and whoever opens the file from there does that for itself alone.

/// A file, or the system's reason why there is none.
struct ParkedFile {
    FileDescriptor file;
    int error = 0;
};

/// Parks `file` behind the other end of `socket`, or the reason why there is none (-1). False when that is
/// not possible.
[[nodiscard]] bool sendParked(int socket, int file, int error = 0);

/// Opens the file that is parked behind `socket`, and leaves it there for others. Waits for it when it is
/// still on its way.
ParkedFile takeParked(int socket);

} // namespace tarn
