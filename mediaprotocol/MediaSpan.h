#pragma once

#include <cstdint>

namespace tarn {

/// What a renderer made in one piece: `frames` output frames that play the media evenly from `start` to `end`
/// (nanoseconds). The next span starts where this one ends.
struct MediaSpan {
    enum class State : std::uint32_t {
        more,   ///< the media goes on behind it
        ended,  ///< it is the last one, and may hold no frames
        failed, ///< nothing can be rendered behind it; it may hold no frames
    };

    /// Can it be a time? Up to 36 years.
    static constexpr bool isTime(std::int64_t nanoseconds) {
        return nanoseconds >= 0 && nanoseconds <= std::int64_t{1} << 60;
    }

    std::uint32_t generation = 0; ///< of the seek that it follows on
    State state = State::more;
    std::uint32_t frames = 0;
    std::uint32_t bytes = 0; ///< of those frames
    std::int64_t start = 0;
    std::int64_t end = 0;
};

} // namespace tarn
