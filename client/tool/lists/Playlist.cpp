#include "client/tool/lists/Playlist.h"

#include <charconv>
#include <map>

namespace tarn::tool {

namespace {

constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";
constexpr std::string_view blanks = " \t\r";

std::string_view trimmed(std::string_view line) {
    const auto first = line.find_first_not_of(blanks);
    return first == std::string_view::npos ? ""
                                           : line.substr(first, line.find_last_not_of(blanks) - first + 1);
}

template <class Take>
void forEachLine(std::string_view text, char separator, Take take) {
    while (!text.empty()) {
        const auto end = std::min(text.find(separator), text.size());
        take(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
}

/// "File12=path" and the like.
std::vector<std::string> numberedEntries(std::string_view text) {
    std::map<unsigned, std::string> entries;
    forEachLine(text, '\n', [&](std::string_view line) {
        line = trimmed(line);
        const auto equals = line.find('=');
        constexpr std::string_view key = "File";
        if (!line.starts_with(key) || equals == std::string_view::npos)
            return;
        unsigned number = 0;
        std::from_chars(line.data() + key.size(), line.data() + equals, number);
        entries[number] = trimmed(line.substr(equals + 1));
    });
    std::vector<std::string> inOrder;
    inOrder.reserve(entries.size());
    for (auto& [number, entry] : entries)
        inOrder.push_back(std::move(entry));
    return inOrder;
}

} // namespace

std::vector<std::string> playlistEntries(std::string_view text) {
    if (text.starts_with(byteOrderMark))
        text.remove_prefix(byteOrderMark.size());
    std::vector<std::string> entries;
    if (text.find('\0') != std::string_view::npos) {
        forEachLine(text, '\0', [&](std::string_view entry) { entries.emplace_back(entry); });
        return entries;
    }
    if (trimmed(text.substr(0, text.find('\n'))) == "[playlist]")
        return numberedEntries(text);
    forEachLine(text, '\n', [&](std::string_view line) {
        if (const auto entry = trimmed(line); !entry.empty() && entry.front() != '#')
            entries.emplace_back(entry);
    });
    return entries;
}

} // namespace tarn::tool
