#include "decoder/PacketSeeker.h"

#include "decoder/WorkLimit.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
constexpr auto longestWalk = 100ms;

bool mustBeWalked(const Container& container) {
    const AVCodecID codec = container.stream().codecpar->codec_id;
    const bool mpeg = codec == AV_CODEC_ID_MP3 || codec == AV_CODEC_ID_MP2 || codec == AV_CODEC_ID_MP1;
    if (container.isNamed("wav") || container.isNamed("w64"))
        return mpeg;
    return container.isNamed("mp3") || container.isNamed("aac") || container.isNamed("wv");
}

} // namespace

PacketSeeker::PacketSeeker(Container& container, const PacketTimeline& timeline, ByteSource& source,
                           const AVPacket& first)
    : container_(container), timeline_(timeline), walked_(mustBeWalked(container)) {
    if (!container.isNamed("flac") || first.pos < 0)
        return;
    const AVCodecParameters& parameters = *container.stream().codecpar;
    if (const auto info = FlacStreamInfo::parse({reinterpret_cast<const char*>(parameters.extradata),
                                                 static_cast<std::size_t>(parameters.extradata_size)}))
        flac_.emplace(source, first.pos, info->blockSize);
}

// FFmpeg's index reaches up to the last packet that was read so far.
bool PacketSeeker::isKnown(std::int64_t time) const {
    const int count = avformat_index_get_entries_count(&container_.stream());
    return count > 0 && avformat_index_get_entry(&container_.stream(), count - 1)->timestamp >= time;
}

void PacketSeeker::begin(std::int64_t frame) {
    target_ = frame;
    const std::int64_t time = container_.fromFrames(frame);
    walking_ = walked_ && !isKnown(time);
    if (walking_) {
        const int count = avformat_index_get_entries_count(&container_.stream());
        if (count > 0)
            container_.seek(avformat_index_get_entry(&container_.stream(), count - 1)->timestamp);
        return;
    }
    if (flac_)
        if (const auto place = flac_->lastUntil(timeline_.flacNumber(frame));
            place && container_.seekToByte(place->offset))
            return;
    container_.seek(time);
}

bool PacketSeeker::proceed() {
    if (!walking_)
        return true;
    const WorkLimit limit(longestWalk);
    while (const AVPacket* packet = container_.next()) {
        if (timeline_.begin(*packet).value_or(target_) >= target_)
            break;
        if (limit.over())
            return false;
    }
    walking_ = false;
    container_.seek(container_.fromFrames(target_));
    return true;
}

} // namespace tarn
