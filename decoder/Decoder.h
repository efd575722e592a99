#pragma once

#include <cstddef>
#include <cstdint>

#include "pcm/PcmBuffer.h"
#include "roles/Error.h"

namespace tarn {

/// One file being decoded, from any frame on. Used by one thread.
class Decoder {
public:
    enum class State {
        more,
        ended,  ///< what was appended is the last of the file; it may be nothing
        failed, ///< nothing follows; error() says why
    };

    virtual ~Decoder() = default;

    /// The next read() begins exactly at `frame` of the audible part.
    virtual void seek(std::int64_t frame) = 0;

    /// Appends at most `maxFrames` frames to `buffer`, fewer when that is what is at hand.
    virtual State read(PcmBuffer& buffer, std::size_t maxFrames) = 0;

    /// Meaningful after State::failed.
    virtual const Error& error() const = 0;
};

} // namespace tarn
