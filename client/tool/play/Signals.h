#pragma once

#include <optional>

#include "system/FileDescriptor.h"

namespace tarn::tool {

/// The signals that a program on a terminal answers to, as something to wait for. From when this is made they
/// do nothing by themselves: SIGINT, SIGTERM and SIGHUP ask for the end, SIGTSTP (^Z) for a stop, SIGCONT
/// comes after one, and SIGWINCH with another size of the terminal. A job in the background is not stopped
/// when it touches the terminal.
///
/// For a program with one thread.
class Signals {
public:
    Signals();

    /// Readable while there are some.
    int descriptor() const { return signals_.get(); }
    /// The next one, if any.
    std::optional<int> take() const;

    /// Stops this process, as ^Z does to others, until it is continued.
    void stopHere() const;

private:
    FileDescriptor signals_;
};

} // namespace tarn::tool
