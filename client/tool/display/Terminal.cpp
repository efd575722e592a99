#include "client/tool/display/Terminal.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdlib>
#include <string_view>

namespace tarn::tool {

namespace {

constexpr int usualColumns = 80;

std::string_view environment(const char* name) {
    const char* value = std::getenv(name); // NOLINT(concurrency-mt-unsafe): nobody sets it
    return value != nullptr ? value : "";
}

} // namespace

Terminal::Terminal(KeySource source)
    : isLive_(source != KeySource::none && ::isatty(STDOUT_FILENO) == 1 && environment("TERM") != "dumb"),
      hasColor_(isLive_ && environment("NO_COLOR").empty()) {
    if (!isLive_)
        return;
    if (source == KeySource::terminal)
        ownKeys_.reset(::open("/dev/tty", O_RDONLY | O_CLOEXEC));
    keys_ = source == KeySource::terminal ? ownKeys_.get() : STDIN_FILENO;
    if (::tcgetattr(keys_, &before_) != 0)
        keys_ = -1;
}

Terminal::~Terminal() { giveBack(); }

bool Terminal::isForeground() const {
    if (!isLive_)
        return true;
    const auto lentTo = ::tcgetpgrp(STDOUT_FILENO); // fails where no shell controls the terminal
    return lentTo < 0 || lentTo == ::getpgrp();
}

void Terminal::takeKeys() {
    if (keys_ < 0 || !isForeground())
        return;
    termios single = before_;
    single.c_lflag &= ~static_cast<tcflag_t>(ICANON | ECHO);
    single.c_lflag |= NOFLSH; // keys before a ^Z count
    single.c_cc[VMIN] = 0;
    single.c_cc[VTIME] = 0;
    takesKeys_ = ::tcsetattr(keys_, TCSANOW, &single) == 0;
}

void Terminal::giveBack() {
    if (takesKeys_ && isForeground())
        ::tcsetattr(keys_, TCSANOW, &before_);
    takesKeys_ = false;
}

int Terminal::columns() const {
    winsize size{};
    return ::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : usualColumns;
}

std::vector<Key> Terminal::readKeysBeforeSignal() {
    constexpr int moment = 5; // milliseconds
    pollfd keys{keyDescriptor(), POLLIN, 0};
    return isForeground() && ::poll(&keys, 1, moment) == 1 ? readKeys() : std::vector<Key>();
}

std::vector<Key> Terminal::readKeys() {
    std::array<char, 4096> bytes{}; // all that a terminal keeps
    const auto count = ::read(keys_, bytes.data(), bytes.size());
    if (count > 0)
        return keysIn({bytes.data(), static_cast<std::size_t>(count)});
    if (count < 0 && (errno == EINTR || errno == EAGAIN || !isForeground()))
        return {};
    takesKeys_ = false; // the terminal is gone
    return {Key::quit};
}

} // namespace tarn::tool
