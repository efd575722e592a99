#pragma once

#include <optional>

#include "mediaprotocol/RingMemory.h"
#include "pcm/PcmBuffer.h"

namespace tarn {

/// The service's side of a ring. The renderer may be hostile: it can write whatever it likes, whenever it
/// likes, so each of its values is read once and checked before it is used. Used by one thread.
class RingReader {
public:
    explicit RingReader(RingMemory memory) : memory_(std::move(memory)) {}

    /// From here on what is of `generation` counts, in this format. What is there of earlier ones will be
    /// thrown away.
    void begin(std::uint32_t generation, const PcmFormat& format);

    struct Taken {
        enum class What {
            span,
            nothing, ///< is there yet
            lie,     ///< what is there cannot be
        };
        What what = What::nothing;
        MediaSpan span; ///< as much of it as was taken
    };

    /// Appends to `buffer` at most `maxFrames` frames of the oldest span.
    Taken take(PcmBuffer& buffer, std::size_t maxFrames);

    /// Nothing is there: the renderer shall send word when there are `frames` frames, or all that follow. To
    /// be followed by another take().
    void want(std::size_t frames);
    void wantNothing();

    /// True when half of what is kept at hand has been taken since it last was.
    bool hasTakenHalf();

private:
    enum class Next { span, nothing, lie };

    Next readSpan();
    void copy(PcmBuffer& buffer, std::size_t frames) const;
    void release(std::uint32_t frames);

    RingMemory memory_;
    std::uint32_t generation_ = 0;
    std::size_t capacity_ = 0; // in bytes
    std::size_t frameSize_ = 1;
    std::uint64_t bytes_ = 0; // taken
    std::uint64_t spans_ = 0; // taken
    std::uint64_t bytesTold_ = 0;
    std::optional<MediaSpan> current_; // what is left of the span that take() is at
};

} // namespace tarn
