#include "controls/applications/DesktopEntry.h"

#include <algorithm>

#include "localization/LanguageChoice.h"
#include "wire/Utf8.h"

namespace tarn {

namespace {

constexpr std::string_view blanks = " \t\r";

std::string_view trimmed(std::string_view text) {
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    return text.substr(0, text.find_last_not_of(blanks) + 1);
}

/// "Name" gives "", "Name[de]" gives "de"; none for other keys.
std::optional<std::string> languageOfNameKey(std::string_view key) {
    if (key == "Name")
        return "";
    if (key.starts_with("Name[") && key.ends_with(']'))
        return std::string(key.substr(5, key.size() - 6));
    return std::nullopt;
}

std::string unescaped(std::string_view value) {
    constexpr std::string_view letters = "sntr\\";
    constexpr std::string_view meanings = " \n\t\r\\";
    std::string result;
    for (std::size_t index = 0; index < value.size(); ++index) {
        const std::size_t escape =
            value[index] == '\\' && index + 1 < value.size() ? letters.find(value[index + 1]) : letters.npos;
        result += escape == letters.npos ? value[index] : meanings[escape];
        index += escape == letters.npos ? 0 : 1;
    }
    return result;
}

} // namespace

std::optional<DesktopEntry> parseDesktopEntry(std::string_view text) {
    DesktopEntry entry;
    bool isInGroup = false;
    bool isApplication = false;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        const std::string_view line = trimmed(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
        if (line.starts_with('[')) {
            isInGroup = line == "[Desktop Entry]";
            continue;
        }
        const std::size_t sign = line.find('=');
        if (!isInGroup || line.starts_with('#') || sign == line.npos)
            continue;
        const std::string_view key = trimmed(line.substr(0, sign));
        const std::string_view value = trimmed(line.substr(sign + 1));
        if (key == "Type")
            isApplication = value == "Application";
        else if (key == "Hidden")
            entry.isHidden = value == "true";
        else if (auto language = languageOfNameKey(key); language && isValidUtf8(value) && !value.empty())
            entry.names.emplace(std::move(*language), unescaped(value));
    }
    return isApplication || entry.isHidden ? std::optional(std::move(entry)) : std::nullopt;
}

std::optional<std::string> nameInLanguages(const DesktopEntry& entry,
                                           const std::vector<std::string>& languages) {
    std::vector<std::string> offered;
    for (const auto& [language, name] : entry.names)
        offered.push_back(language);
    auto chosen = choosePreferredLocalizations(offered, languages);
    chosen.emplace_back();
    const auto found = entry.names.find(chosen.front());
    return found == entry.names.end() ? std::nullopt : std::optional(found->second);
}

} // namespace tarn
