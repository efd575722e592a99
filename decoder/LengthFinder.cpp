#include "decoder/LengthFinder.h"

#include <algorithm>

#include "decoder/FlacSearch.h"
#include "decoder/MpegEstimate.h"
#include "decoder/TtaLength.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr std::int64_t tailMilliseconds = 1500; // more than any packet lasts
constexpr std::int64_t shortFile = 16 << 20;    // read whole in a few hundredths of a second
constexpr auto longestReading = 500ms;          // of processor time, where it is not known how much it is

} // namespace

bool LengthFinder::readFirstPacket() {
    const AVPacket* packet = container_.next();
    if (packet == nullptr)
        return false;
    timeline_ = PacketTimeline(container_, *packet);
    position_ = packet->pos;
    end_ = timeline_.first();
    note(*packet);
    return true;
}

std::int64_t LengthFinder::origin() const {
    const std::int64_t origin = timeline_.first() + timeline_.skipped();
    return timeline_.first() > 0 ? origin : std::max<std::int64_t>(0, origin);
}

void LengthFinder::note(const AVPacket& packet) {
    end_ = timeline_.begin(packet).value_or(end_) + timeline_.length(packet);
    discarded_ = trimOf(packet).end;
    if (container_.stream().codecpar->codec_id == AV_CODEC_ID_TTA)
        last_.reset(av_packet_clone(&packet));
}

bool LengthFinder::readOn(const WorkLimit& limit) {
    while (const AVPacket* packet = container_.next()) {
        note(*packet);
        if (limit.over())
            return false;
    }
    return true;
}

// Files without any table. Only reading all of them tells how many frames there are.
bool LengthFinder::isBareFrames() const { return container_.isNamed("mp3") || container_.isNamed("aac"); }

// Matroska counts in milliseconds; and in CAF the last packet is as long as the others, although the
// codec makes fewer frames of it.
bool LengthFinder::containerKnows() const {
    const AVFormatContext& context = container_.context();
    return !container_.isNamed("matroska") && !container_.isNamed("caf") &&
           context.duration_estimation_method != AVFMT_DURATION_FROM_BITRATE &&
           container_.stream().duration != AV_NOPTS_VALUE;
}

std::int64_t LengthFinder::endByContainer() const {
    const AVStream& stream = container_.stream();
    const std::int64_t duration = container_.toFrames(stream.duration);
    if (container_.isNamed("mp3")) // counted from the first packet on
        return duration;
    const std::int64_t start =
        stream.start_time == AV_NOPTS_VALUE ? 0 : container_.toFrames(stream.start_time);
    if (stream.codecpar->codec_id == AV_CODEC_ID_OPUS && container_.isNamed("ogg")) // counts what is skipped
        return start + duration - timeline_.skipped();
    return start + duration;
}

std::optional<std::int64_t> LengthFinder::endOfFlac() const {
    const AVCodecParameters& parameters = *container_.stream().codecpar;
    const auto info = FlacStreamInfo::parse({reinterpret_cast<const char*>(parameters.extradata),
                                             static_cast<std::size_t>(parameters.extradata_size)});
    const auto last = info ? FlacSearch(source_, position_, info->blockSize).last() : std::nullopt;
    if (!last)
        return std::nullopt;
    return last->frame.first - timeline_.flacNumber(0) + last->frame.samples;
}

// Only the last packets tell, to the frame, where it ends.
std::optional<std::int64_t> LengthFinder::endOfTail() {
    const std::int64_t duration = container_.context().duration; // in microseconds
    constexpr std::int64_t tail = tailMilliseconds * 1000;
    if (duration > tail)
        container_.seek(
            av_rescale_q(duration - tail, AVRational{1, AV_TIME_BASE}, container_.stream().time_base));
    if (!readOn(WorkLimit(longestReading)) || container_.failure())
        return std::nullopt;
    const auto length = last_ ? findTtaLength(container_, *last_) : std::nullopt;
    return length ? length : endOfRead();
}

std::optional<std::int64_t> LengthFinder::end() {
    if (containerKnows())
        return endByContainer();
    if (container_.isNamed("flac"))
        return endOfFlac();
    if (isBareFrames())
        return source_.size() <= shortFile && readOn(WorkLimit(longestReading)) && !container_.failure()
                   ? std::optional(endOfRead())
                   : std::nullopt;
    return endOfTail();
}

std::optional<std::int64_t> LengthFinder::estimate() {
    if (isBareFrames())
        return estimateMpegSamples(source_, std::max<std::int64_t>(0, position_));
    const std::int64_t duration = container_.context().duration;
    if (duration <= 0)
        return std::nullopt;
    return av_rescale(duration, container_.stream().codecpar->sample_rate, AV_TIME_BASE);
}

} // namespace tarn
