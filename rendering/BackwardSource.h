#pragma once

#include "pcm/PcmFormat.h"
#include "rendering/FrameSource.h"

namespace tarn {

/// Another source's frames in reverse: reads it in pieces, from the last one to the first, and turns each
/// around.
class BackwardSource final : public FrameSource {
public:
    /// `forward` outlives the source, and is used by nobody else meanwhile.
    BackwardSource(FrameSource& forward, const PcmFormat& format) : forward_(forward), format_(format) {}

    void seek(std::int64_t position) override;
    Decoder::State read(PcmBuffer& buffer, std::size_t maxFrames) override;
    const Error& error() const override { return forward_.error(); }

private:
    bool readPiece();

    FrameSource& forward_;
    const PcmFormat format_;
    std::int64_t position_ = 0; // where piece_ begins
    PcmBuffer piece_;           // its first `left_` frames are still to come, the last of them first
    std::size_t left_ = 0;
};

} // namespace tarn
