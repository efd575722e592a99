#include "client/tool/display/Terminal.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <string_view>
#include <utility>

#include "wire/Utf8.h"

namespace tarn::tool {

namespace {

constexpr int usualColumns = 80;

std::string_view environment(const char* name) {
    const char* value = std::getenv(name); // NOLINT(concurrency-mt-unsafe): nobody sets it
    return value != nullptr ? value : "";
}

constexpr std::pair<std::string_view, Key> keys[] = {
    {"\x1b[C", Key::seekForward},
    {"\x1b[D", Key::seekBack},
    {"\x1bOC", Key::seekForward},
    {"\x1bOD", Key::seekBack},
    {" ", Key::pause},
    {"p", Key::pause},
    {"n", Key::next},
    {">", Key::next},
    {"l", Key::seekForward},
    {"h", Key::seekBack},
    {"[", Key::slower},
    {"-", Key::slower},
    {"]", Key::faster},
    {"+", Key::faster},
    {"q", Key::quit},
    {"Q", Key::quit},
    {"\x04", Key::quit},
};

/// Bytes of the key press that `text` begins with. Keys that have no character send a sequence, which is one
/// press also when it means nothing here.
std::size_t lengthOfPress(std::string_view text) {
    if (!text.starts_with("\x1b[") && !text.starts_with("\x1bO"))
        return 1;
    const auto last = std::find_if(text.begin() + 2, text.end(),
                                   [](char character) { return character >= '@' && character <= '~'; });
    return static_cast<std::size_t>(last - text.begin()) + (last == text.end() ? 0 : 1);
}

/// Of one character, and its length in bytes. What cannot be shown is a question mark.
struct Shown {
    std::string_view text;
    std::size_t length;
    int columns;
};

Shown shownOf(std::string_view text) {
    const auto length = utf8CharacterLength(text);
    const int columns = length == 0 ? -1 : ::wcwidth(static_cast<wchar_t>(utf8CharacterValue(text, length)));
    if (columns < 0)
        return {"?", length == 0 ? 1 : length, 1};
    return {text.substr(0, length), length, columns};
}

} // namespace

Terminal::Terminal()
    : isLive_(::isatty(STDOUT_FILENO) == 1 && environment("TERM") != "dumb"),
      hasColor_(isLive_ && environment("NO_COLOR").empty()) {}

void Terminal::takeKeys() {
    hasKeys_ = isLive_ && ::isatty(STDIN_FILENO) == 1 && ::tcgetattr(STDIN_FILENO, &before_) == 0;
    if (!hasKeys_)
        return;
    termios single = before_;
    single.c_lflag &= ~static_cast<tcflag_t>(ICANON | ECHO);
    single.c_cc[VMIN] = 0;
    single.c_cc[VTIME] = 0;
    ::tcsetattr(STDIN_FILENO, TCSANOW, &single);
}

Terminal::~Terminal() {
    if (hasKeys_)
        ::tcsetattr(STDIN_FILENO, TCSANOW, &before_);
}

int Terminal::columns() const {
    winsize size{};
    return ::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : usualColumns;
}

std::vector<Key> Terminal::readKeys() const {
    std::array<char, 64> bytes{};
    const auto count = ::read(STDIN_FILENO, bytes.data(), bytes.size());
    if (count <= 0)
        return {Key::quit};
    std::vector<Key> pressed;
    for (std::string_view rest(bytes.data(), static_cast<std::size_t>(count)); !rest.empty();) {
        std::size_t length = lengthOfPress(rest);
        for (const auto& [text, key] : keys) {
            if (!rest.starts_with(text))
                continue;
            pressed.push_back(key);
            length = text.size();
            break;
        }
        rest.remove_prefix(length);
    }
    return pressed;
}

std::string printable(std::string_view text) {
    std::string out;
    while (!text.empty()) {
        const auto length = utf8CharacterLength(text);
        const auto value = length == 0 ? U'\0' : utf8CharacterValue(text, length);
        const bool controls = value < 0x20 || (value >= 0x7F && value < 0xA0);
        out += controls ? "?" : text.substr(0, length);
        text.remove_prefix(std::max<std::size_t>(length, 1));
    }
    return out;
}

int columnsOf(const std::string& text) {
    int columns = 0;
    for (std::string_view rest = text; !rest.empty();) {
        const auto shown = shownOf(rest);
        columns += shown.columns;
        rest.remove_prefix(shown.length);
    }
    return columns;
}

std::string fitColumns(const std::string& text, int columns) {
    const bool fits = columnsOf(text) <= columns;
    const int room = fits ? columns : columns - 1;
    std::string out;
    int used = 0;
    for (std::string_view rest = text; !rest.empty();) {
        const auto shown = shownOf(rest);
        if (used + shown.columns > room)
            break;
        out += shown.text;
        used += shown.columns;
        rest.remove_prefix(shown.length);
    }
    return fits || columns <= 0 ? out : out + "…";
}

} // namespace tarn::tool
