#pragma once

#include "decoder/Decoder.h"
#include "pcm/PcmBuffer.h"

namespace tarn {

/// The frames of a file one after the other, in some format and direction.
class FrameSource {
public:
    virtual ~FrameSource() = default;

    /// The next read() begins at the boundary before frame `position`, counted from the beginning of the
    /// file in frames of the source's format: it goes on with that frame, or backwards with the one before.
    virtual void seek(std::int64_t position) = 0;

    /// Appends at most `maxFrames` frames; fewer only when the state is not `more`.
    virtual Decoder::State read(PcmBuffer& buffer, std::size_t maxFrames) = 0;

    /// Meaningful after State::failed.
    virtual const Error& error() const = 0;
};

} // namespace tarn
