#include "client/tool/display/Keys.h"

#include <algorithm>
#include <utility>

namespace tarn::tool {

namespace {

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

} // namespace

std::vector<Key> keysIn(std::string_view sent) {
    std::vector<Key> pressed;
    while (!sent.empty()) {
        const auto press = sent.substr(0, lengthOfPress(sent));
        const auto* found = std::find_if(std::begin(keys), std::end(keys),
                                         [&](const auto& key) { return key.first == press; });
        if (found != std::end(keys))
            pressed.push_back(found->second);
        sent.remove_prefix(press.size());
    }
    return pressed;
}

} // namespace tarn::tool
