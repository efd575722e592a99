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

    int descriptor() const { return memory_.descriptor(); }
    std::size_t capacity() const { return memory_.capacity(); }

    struct Taken {
        enum class What {
            span,
            nothing, ///< of this generation is there yet
            lie,     ///< what is there cannot be
        };
        What what = What::nothing;
        MediaSpan span; ///< as much of it as was taken
    };

    /// Appends to `buffer` at most `maxFrames` frames of the oldest span of `generation`. What is there of
    /// earlier generations is thrown away.
    Taken take(std::uint32_t generation, PcmBuffer& buffer, std::size_t maxFrames);

    /// Nothing is there: the renderer shall send word when there are `frames` frames, or the last ones. To be
    /// followed by another take().
    void want(std::size_t frames);
    void wantNothing();

    /// How many frames have been taken since this was last asked for `frames` or more; true when so many.
    bool hasTaken(std::size_t frames);

private:
    bool readSpan();
    void copyFrames(PcmBuffer& buffer, std::size_t frames) const;
    void release(std::size_t frames);

    RingMemory memory_;
    std::uint64_t frames_ = 0; // taken
    std::uint64_t spans_ = 0;  // taken
    std::uint64_t framesTold_ = 0;
    std::optional<MediaSpan> current_; // what is left of the span that take() is at
};

} // namespace tarn
