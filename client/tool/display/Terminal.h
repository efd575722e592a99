#pragma once

#include <termios.h>

#include <string>
#include <string_view>
#include <vector>

namespace tarn::tool {

/// What a person can press while something plays.
enum class Key { pause, next, seekBack, seekForward, slower, faster, quit };

/// The terminal that the tool runs on, if it does.
class Terminal {
public:
    Terminal();
    ~Terminal();
    Terminal(const Terminal&) = delete;
    Terminal& operator=(const Terminal&) = delete;

    /// Is standard output a terminal that a line can be redrawn on?
    bool isLive() const { return isLive_; }
    /// From now on, as long as this lives, keys come one by one, if they can be read.
    void takeKeys();
    /// Do they?
    bool hasKeys() const { return hasKeys_; }
    bool hasColor() const { return hasColor_; }
    int columns() const;

    /// The keys that were pressed; never waits. Ends with `quit` when the input has ended.
    std::vector<Key> readKeys() const;

private:
    bool isLive_ = false;
    bool hasKeys_ = false;
    bool hasColor_ = false;
    termios before_{};
};

/// The first columns of a text, with an ellipsis when something was cut off. Characters that a terminal would
/// take as commands become question marks.
std::string fitColumns(const std::string& text, int columns);

/// All of a text, in one line: what is no character or controls a terminal becomes question marks.
std::string printable(std::string_view text);

/// Columns that a text takes on a terminal.
int columnsOf(const std::string& text);

} // namespace tarn::tool
