#pragma once

#include <memory>
#include <optional>

#include "decoder/Converter.h"
#include "mediaprotocol/AudioFileInfo.h"
#include "rendering/FrameSource.h"

namespace tarn {

/// A decoder's frames, converted to another format where that differs; where it does not, they pass
/// untouched.
class ForwardSource final : public FrameSource {
public:
    /// `decoder` outlives the source.
    ForwardSource(Decoder& decoder, const AudioFileInfo& info, const PcmFormat& format);

    /// In frames of the source's format; none when the file does not tell.
    std::optional<std::int64_t> length() const { return length_; }

    void seek(std::int64_t position) override;
    Decoder::State read(PcmBuffer& buffer, std::size_t maxFrames) override;
    const Error& error() const override { return decoder_.error(); }

private:
    Decoder::State readConverted(PcmBuffer& buffer, std::size_t maxFrames);
    void convertMore();
    void moveOut(PcmBuffer& buffer, std::size_t frames);

    Decoder& decoder_;
    const PcmFormat from_;
    const PcmFormat to_;
    const std::unique_ptr<Converter> converter_; // null when the formats agree
    std::optional<std::int64_t> length_;

    // Of the conversion; without one the decoder knows all this.
    std::int64_t position_ = 0;
    PcmBuffer decoded_;
    PcmBuffer converted_;    // what was not handed out yet begins at taken_
    std::size_t taken_ = 0;  // in frames
    std::size_t excess_ = 0; // frames before the target of a seek, still to drop
    Decoder::State state_ = Decoder::State::more;
};

} // namespace tarn
