#pragma once

#include <string_view>

#include "proto/Message.h"

namespace tarn {

/// A player item's playback position, in seconds.
class VLProtoAudioFilePlayerCurrentTime final : public Message<VLProtoAudioFilePlayerCurrentTime> {
public:
    static constexpr std::string_view className = "VLProtoAudioFilePlayerCurrentTime";

    double currentTime() const { return currentTime_; }
    void setCurrentTime(double value) { currentTime_ = value; }

    static constexpr auto fields() { return std::tuple{required(1, "currentTime", &Self::currentTime_)}; }

private:
    double currentTime_ = 0;
};

extern template class Message<VLProtoAudioFilePlayerCurrentTime>;

} // namespace tarn
