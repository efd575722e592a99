#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tarn {

/// One tag of an audio file.
class MediaMetadataItem {
public:
    static constexpr std::string_view commonKeySpace = "common";
    static constexpr std::string_view commonKeyTitle = "title";
    static constexpr std::string_view commonKeyAlbumName = "albumName";
    static constexpr std::string_view commonKeyArtist = "artist";

    /// `key` and `keySpace` are names that outlive the item, as those above do: thousands of items share
    /// them. `stringValue` is none when the tag's value is not text; text is valid UTF-8.
    MediaMetadataItem(std::string_view key, std::string_view keySpace,
                      std::optional<std::string> stringValue);

    std::string_view key() const { return key_; }
    std::string_view keySpace() const { return keySpace_; }
    const std::optional<std::string>& stringValue() const { return stringValue_; }

    /// The items with that key in that key space, in their order.
    static std::vector<MediaMetadataItem> metadataItemsFromArray(const std::vector<MediaMetadataItem>& items,
                                                                 std::string_view key,
                                                                 std::string_view keySpace);

private:
    std::string_view key_;
    std::string_view keySpace_;
    std::optional<std::string> stringValue_;
};

} // namespace tarn
