#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"

namespace tarn {

/// A player item and the position that it is to move to, in seconds.
class VLProtoAudioFilePlayerItemSetCurrentTime final
    : public Message<VLProtoAudioFilePlayerItemSetCurrentTime> {
public:
    static constexpr std::string_view className = "VLProtoAudioFilePlayerItemSetCurrentTime";

    const std::optional<std::string>& identifier() const { return identifier_; }
    void setIdentifier(std::optional<std::string> value) { identifier_ = std::move(value); }

    double currentTime() const { return currentTime_; }
    void setCurrentTime(double value) { setFlagged(2, currentTime_, value); }
    bool hasCurrentTime() const { return presence_[2]; }
    void setHasCurrentTime(bool present) { presence_.set(2, present); }

    static constexpr auto fields() {
        return std::tuple{required(1, "identifier", &Self::identifier_),
                          optional(2, "currentTime", &Self::currentTime_)};
    }

private:
    std::optional<std::string> identifier_;
    double currentTime_ = 0;
};

extern template class Message<VLProtoAudioFilePlayerItemSetCurrentTime>;

} // namespace tarn
