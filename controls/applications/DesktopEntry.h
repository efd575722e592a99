#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tarn {

/// What a desktop entry says of an application.
struct DesktopEntry {
    bool isHidden = false;                    // stands for "not installed", whatever other folders say
    std::map<std::string, std::string> names; // by language; "" is the one for all others
};

/// None when the text is no desktop entry of an application. Lines that cannot be read cost only themselves.
std::optional<DesktopEntry> parseDesktopEntry(std::string_view text);

/// The entry's name for a person in the best of `languages`; none when it has none.
std::optional<std::string> nameInLanguages(const DesktopEntry& entry,
                                           const std::vector<std::string>& languages);

} // namespace tarn
