#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"

namespace tarn {

/// A queue player and the rate that it is to play at: 0 pauses, 1 is as recorded.
class VLProtoAudioFileQueuePlayerSetRate final : public Message<VLProtoAudioFileQueuePlayerSetRate> {
public:
    static constexpr std::string_view className = "VLProtoAudioFileQueuePlayerSetRate";

    const std::optional<std::string>& identifier() const { return identifier_; }
    void setIdentifier(std::optional<std::string> value) { identifier_ = std::move(value); }

    float rate() const { return rate_; }
    void setRate(float value) { rate_ = value; }

    static constexpr auto fields() {
        return std::tuple{required(1, "identifier", &Self::identifier_), required(2, "rate", &Self::rate_)};
    }

private:
    std::optional<std::string> identifier_;
    float rate_ = 0;
};

extern template class Message<VLProtoAudioFileQueuePlayerSetRate>;

} // namespace tarn
