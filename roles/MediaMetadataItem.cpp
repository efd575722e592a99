#include "roles/MediaMetadataItem.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace tarn {

MediaMetadataItem::MediaMetadataItem(std::string_view key, std::string_view keySpace,
                                     std::optional<std::string> stringValue)
    : key_(key), keySpace_(keySpace), stringValue_(std::move(stringValue)) {}

std::vector<MediaMetadataItem>
MediaMetadataItem::metadataItemsFromArray(const std::vector<MediaMetadataItem>& items, std::string_view key,
                                          std::string_view keySpace) {
    std::vector<MediaMetadataItem> found;
    std::copy_if(items.begin(), items.end(), std::back_inserter(found),
                 [&](const auto& item) { return item.key() == key && item.keySpace() == keySpace; });
    return found;
}

} // namespace tarn
