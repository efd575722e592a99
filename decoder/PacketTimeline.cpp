#include "decoder/PacketTimeline.h"

#include <cstdlib>
#include <cstring>

#include "decoder/FlacFrame.h"
#include "decoder/PacketLength.h"

namespace tarn {

namespace {

std::string_view bytesOf(const AVPacket& packet) {
    return {reinterpret_cast<const char*>(packet.data), static_cast<std::size_t>(packet.size)};
}

std::string_view extradataOf(const AVCodecParameters& parameters) {
    return {reinterpret_cast<const char*>(parameters.extradata),
            static_cast<std::size_t>(parameters.extradata_size)};
}

bool isAdpcm(AVCodecID codec) {
    return codec == AV_CODEC_ID_ADPCM_MS || codec == AV_CODEC_ID_ADPCM_IMA_WAV ||
           codec == AV_CODEC_ID_ADPCM_IMA_QT;
}

} // namespace

PacketTrim trimOf(const AVPacket& packet) {
    std::size_t size = 0;
    const std::uint8_t* data = av_packet_get_side_data(&packet, AV_PKT_DATA_SKIP_SAMPLES, &size);
    std::uint32_t words[2] = {};
    if (data != nullptr && size >= sizeof words)
        std::memcpy(words, data, sizeof words); // little-endian, like every machine that this runs on
    return {words[0], words[1]};
}

PacketTimeline::PacketTimeline(const Container& container, const AVPacket& first) : container_(&container) {
    first_ = first.pts == AV_NOPTS_VALUE ? 0 : container.toFrames(first.pts);
    skipped_ = trimOf(first).start;
    if (skipped_ == 0 && first_ < 0)
        skipped_ = container.stream().codecpar->initial_padding;
    tick_ = container.toFrames(1);
    if (tick_ > 1) {
        if (std::llabs(first_ + skipped_) <= tick_)
            first_ = -skipped_;
        grid_ = framesIn(container.stream(), first).value_or(0);
        findVorbisBlocks();
        if (grid_ <= tick_) // stamps are rounded, so they are off by half a tick
            grid_ = 0;
    }
    findFlacNumbers(first);
    findBlocks(first);
}

// Packets of Vorbis overlap, and make half or a quarter of the sum of two block sizes: so all begin on
// multiples of a quarter of the shorter one.
void PacketTimeline::findVorbisBlocks() {
    const AVCodecParameters& parameters = *container_->stream().codecpar;
    constexpr std::size_t blockSizes = 28; // in the first header
    if (parameters.codec_id != AV_CODEC_ID_VORBIS)
        return;
    const std::string_view headers = extradataOf(parameters);
    const std::size_t first = headers.find("\1vorbis");
    if (first == headers.npos || first + blockSizes >= headers.size())
        return;
    grid_ = (std::int64_t{1} << (headers[first + blockSizes] & 15)) / 4;
    vorbis_.reset(av_vorbis_parse_init(parameters.extradata, parameters.extradata_size));
}

void PacketTimeline::findFlacNumbers(const AVPacket& first) {
    const AVCodecParameters& parameters = *container_->stream().codecpar;
    if (parameters.codec_id != AV_CODEC_ID_FLAC)
        return;
    const auto info = FlacStreamInfo::parse(extradataOf(parameters));
    const auto frame = FlacFrame::parse(bytesOf(first), info ? info->blockSize : 0);
    if (!frame)
        return;
    flacBlockSize_ = info ? info->blockSize : frame->samples;
    flacOffset_ = first_ - FlacFrame::parse(bytesOf(first), flacBlockSize_)->first;
}

void PacketTimeline::findBlocks(const AVPacket& first) {
    AVCodecParameters& parameters = *container_->stream().codecpar;
    const bool inBlocks =
        container_->isNamed("wav") || container_->isNamed("w64") || container_->isNamed("aiff");
    if (!inBlocks || !isAdpcm(parameters.codec_id) || parameters.block_align <= 0 || first.pos < 0)
        return;
    blockFrames_ = av_get_audio_frame_duration2(&parameters, parameters.block_align);
    firstBlock_ = first.pos;
}

// A stamp that lies nowhere near the grid shows that the packets are not all of one length after all.
std::int64_t PacketTimeline::onGrid(std::int64_t frame) const {
    const std::int64_t offset = frame - first_;
    const std::int64_t half = offset >= 0 ? grid_ / 2 : -grid_ / 2;
    const std::int64_t nearest = first_ + (offset + half) / grid_ * grid_;
    return std::llabs(nearest - frame) <= tick_ ? nearest : frame;
}

std::optional<std::int64_t> PacketTimeline::begin(const AVPacket& packet) const {
    if (flacBlockSize_ > 0)
        if (const auto frame = FlacFrame::parse(bytesOf(packet), flacBlockSize_))
            return frame->first + flacOffset_;
    if (blockFrames_ > 0 && packet.pos >= firstBlock_)
        return (packet.pos - firstBlock_) / container_->stream().codecpar->block_align * blockFrames_;
    if (packet.pts == AV_NOPTS_VALUE)
        return std::nullopt;
    const std::int64_t frame = container_->toFrames(packet.pts);
    return grid_ > 0 ? onGrid(frame) : frame;
}

std::int64_t PacketTimeline::length(const AVPacket& packet) {
    if (vorbis_)
        if (const int frames = av_vorbis_parse_frame(vorbis_.get(), packet.data, packet.size); frames > 0)
            return frames;
    return framesIn(container_->stream(), packet).value_or(container_->toFrames(packet.duration));
}

} // namespace tarn
