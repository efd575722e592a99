#pragma once

#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"

namespace tarn {

/// Lets what would have been heard fade into what is heard instead, so that nothing clicks.
class Crossfade {
public:
    /// `old` is what would have been heard. The fade is as long as that.
    void begin(PcmBuffer old, const PcmFormat& format);

    /// Mixes the old frames into the frames that `buffer` begins with, as far as the fade still goes.
    void apply(PcmBuffer& buffer);

    bool pending() const { return done_ < old_.frames; }

    /// What was begun is not gone on with.
    void reset() { old_.clear(); }

private:
    template <class Sample>
    void mix(PcmBuffer& buffer, std::size_t frames);

    PcmFormat format_;
    PcmBuffer old_;
    std::size_t done_ = 0;
};

} // namespace tarn
