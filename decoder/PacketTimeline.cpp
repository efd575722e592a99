#include "decoder/PacketTimeline.h"

#include <cstdlib>
#include <cstring>

namespace tarn {

namespace {

constexpr std::int64_t shortestOpusTicks = 5;

}

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
    const std::int64_t framesPerTick = container.toFrames(1);
    if (framesPerTick <= 1)
        return;
    if (std::llabs(first_ + skipped_) <= framesPerTick)
        first_ = -skipped_;
    const AVCodecParameters& parameters = *container.stream().codecpar;
    if (parameters.codec_id == AV_CODEC_ID_OPUS) // whole milliseconds but for the shortest packets
        grid_ = first.duration >= shortestOpusTicks ? container.toFrames(first.duration) : 0;
    else if (parameters.codec_id == AV_CODEC_ID_AAC || parameters.codec_id == AV_CODEC_ID_MP3)
        grid_ = parameters.frame_size;
}

std::int64_t PacketTimeline::frameAt(std::int64_t timestamp) const {
    const std::int64_t frame = container_->toFrames(timestamp);
    if (grid_ <= 0)
        return frame;
    const std::int64_t offset = frame - first_;
    const std::int64_t half = offset >= 0 ? grid_ / 2 : -grid_ / 2;
    return first_ + (offset + half) / grid_ * grid_;
}

} // namespace tarn
