#pragma once

#include <termios.h>

#include <vector>

#include "client/tool/display/Keys.h"
#include "system/FileDescriptor.h"

namespace tarn::tool {

/// The terminal that the tool runs on, if it does: what is shown on it, and the keys that are pressed there.
///
/// A shell lends the terminal to one of its jobs at a time. The others must neither write to it, since people
/// type there meanwhile, nor read from it or change its settings, for which they would be stopped. So
/// everything here is for the foreground, and who uses it asks isForeground() each time.
///
/// For one thread.
class Terminal {
public:
    /// Where keys come from: standard input, unless that is a list of files. `none` is for a program that
    /// nobody looks at.
    enum class KeySource { standardInput, terminal, none };

    explicit Terminal(KeySource source);
    ~Terminal();
    Terminal(const Terminal&) = delete;
    Terminal& operator=(const Terminal&) = delete;

    /// Is standard output a terminal that a line can be redrawn on?
    bool isLive() const { return isLive_; }
    bool hasColor() const { return hasColor_; }
    int columns() const;

    /// Is this the job that the terminal is lent to? Without a terminal: always.
    bool isForeground() const;

    /// From now on keys come one by one. Does nothing in the background, or where there are no keys.
    void takeKeys();
    /// Back to how it was found, for the shell or the next program.
    void giveBack();

    /// Readable when keys wait; -1 while none are taken.
    int keyDescriptor() const { return takesKeys_ ? keys_ : -1; }
    /// The keys that were pressed; never waits. Ends with `quit` when the terminal is gone.
    std::vector<Key> readKeys();
    /// Those before a key that has sent a signal. The signal may be there a moment before them.
    std::vector<Key> readKeysBeforeSignal();

private:
    bool isLive_ = false;
    bool hasColor_ = false;
    bool takesKeys_ = false;
    FileDescriptor ownKeys_; // when they do not come from standard input
    int keys_ = -1;          // a terminal; -1 when there is none
    termios before_{};
};

} // namespace tarn::tool
