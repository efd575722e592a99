#include "client/tool/display/Columns.h"

#include <algorithm>
#include <cwchar>

#include "wire/Utf8.h"

namespace tarn::tool {

namespace {

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
