#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tarn {

/// What the AppStream metadata of a component says of where it belongs.
struct Metainfo {
    std::string identifier;
    bool isAddon = false;
    std::vector<std::string> extends;        // the components that an add-on belongs to
    std::vector<std::string> desktopEntries; // what launches it, without ".desktop"
};

/// None when `xml` is no well-formed description of one component, or declares a document type: metadata has
/// none, and entities are a way to attack its readers.
std::optional<Metainfo> parseMetainfo(std::string_view xml);

/// `name` without a ".desktop" at its end.
std::string withoutDesktopSuffix(std::string_view name);

} // namespace tarn
