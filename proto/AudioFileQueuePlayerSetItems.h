#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"
#include "proto/TextList.h"

namespace tarn {

/// A queue player and the player items that it is to play, in order.
class VLProtoAudioFileQueuePlayerSetItems final : public Message<VLProtoAudioFileQueuePlayerSetItems> {
public:
    static constexpr std::string_view className = "VLProtoAudioFileQueuePlayerSetItems";

    const std::optional<std::string>& identifier() const { return identifier_; }
    void setIdentifier(std::optional<std::string> value) { identifier_ = std::move(value); }

    using playerItemIdentifiersType = std::string;
    const std::optional<TextList>& playerItemIdentifiers() const { return playerItemIdentifiers_; }
    void setPlayerItemIdentifiers(std::optional<TextList> list) { playerItemIdentifiers_ = std::move(list); }
    void clearPlayerItemIdentifiers() { clearList(playerItemIdentifiers_); }
    void addPlayerItemIdentifiers(std::string_view element) {
        listCreateIfNeeded(playerItemIdentifiers_).push_back(element);
    }
    std::size_t playerItemIdentifiersCount() const {
        return playerItemIdentifiers_ ? playerItemIdentifiers_->size() : 0;
    }
    /// Good until the list changes. Throws std::out_of_range.
    std::string_view playerItemIdentifiersAtIndex(std::size_t index) const {
        return elementAt(playerItemIdentifiers_, index);
    }

    static constexpr auto fields() {
        return std::tuple{required(1, "identifier", &Self::identifier_),
                          repeated(2, "playerItemIdentifiers", &Self::playerItemIdentifiers_)};
    }

private:
    std::optional<std::string> identifier_;
    std::optional<TextList> playerItemIdentifiers_;
};

extern template class Message<VLProtoAudioFileQueuePlayerSetItems>;

} // namespace tarn
