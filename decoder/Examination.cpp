#include "decoder/Examination.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "decoder/Container.h"
#include "decoder/Gapless.h"
#include "decoder/PacketTimeline.h"
#include "decoder/Samples.h"
#include "decoder/Tags.h"
#include "decoder/WavPromise.h"

namespace tarn {

namespace {

constexpr std::int64_t tailSeconds = 5;
constexpr std::int64_t longestSeconds = 365L * 24 * 3600; // whatever claims more does not know
constexpr std::int64_t editListToleranceMilliseconds = 2;

bool isMatroska(const AVFormatContext& context) {
    return std::strstr(context.iformat->name, "matroska") != nullptr;
}

bool isMpeg4(const AVFormatContext& context) { return std::strstr(context.iformat->name, "mp4") != nullptr; }

bool isOgg(const AVFormatContext& context) { return std::strcmp(context.iformat->name, "ogg") == 0; }

/// Finds where the audible part of a container begins and ends, in frames of the decoder's raw output.
class LengthFinder {
public:
    explicit LengthFinder(Container& container) : container_(container) {}

    /// False when the file holds no packet of audio.
    bool readFirstPacket() {
        AVPacket* packet = container_.next();
        if (packet == nullptr)
            return false;
        timeline_ = PacketTimeline(container_, *packet);
        position_ = packet->pos;
        end_ = timeline_.first();
        note(*packet);
        return true;
    }

    std::int64_t firstPacketPosition() const { return position_; }

    /// By the container's own account.
    std::int64_t origin() const {
        const std::int64_t origin = timeline_.first() + timeline_.skipped();
        return timeline_.first() > 0 ? origin : std::max<std::int64_t>(0, origin);
    }

    std::optional<std::int64_t> end() {
        const AVFormatContext& context = container_.context();
        const AVStream& stream = container_.stream();
        if (isMatroska(context))
            return endOfTail();
        if (context.duration_estimation_method == AVFMT_DURATION_FROM_BITRATE ||
            stream.duration == AV_NOPTS_VALUE)
            return endOfPackets();
        const std::int64_t duration = container_.toFrames(stream.duration);
        if (stream.codecpar->codec_id == AV_CODEC_ID_MP3) // counted from the first packet on
            return duration;
        const std::int64_t start =
            stream.start_time == AV_NOPTS_VALUE ? 0 : container_.toFrames(stream.start_time);
        if (stream.codecpar->codec_id == AV_CODEC_ID_OPUS && isOgg(context)) // counts what is skipped
            return start + duration - timeline_.skipped();
        return start + duration;
    }

private:
    void note(const AVPacket& packet) {
        if (packet.pts != AV_NOPTS_VALUE)
            end_ = timeline_.frameAt(packet.pts);
        const int constant = container_.stream().codecpar->frame_size;
        end_ += constant > 0 ? constant : container_.toFrames(packet.duration);
        discarded_ = trimOf(packet).end;
    }

    std::optional<std::int64_t> endOfPackets() {
        while (const AVPacket* packet = container_.next())
            note(*packet);
        if (container_.failure())
            return std::nullopt;
        return end_ - discarded_;
    }

    // Only the last packets tell, to the frame, where it ends.
    std::optional<std::int64_t> endOfTail() {
        const std::int64_t duration = container_.context().duration;
        constexpr std::int64_t tail = tailSeconds * AV_TIME_BASE;
        if (duration > tail)
            container_.seek(
                av_rescale_q(duration - tail, AVRational{1, AV_TIME_BASE}, container_.stream().time_base));
        return endOfPackets();
    }

    Container& container_;
    PacketTimeline timeline_;
    std::int64_t position_ = -1;
    std::int64_t end_ = 0;
    std::int64_t discarded_ = 0;
};

// An edit list tells the end in coarse units. Where it means the end of the media, that one is exact.
std::int64_t unroundedEnd(std::int64_t end, ByteSource& source) {
    Container whole;
    if (whole.open(source, Container::EditLists::ignored))
        return end;
    const AVStream& stream = whole.stream();
    const AVPacket* first = whole.next();
    if (first == nullptr || first->pts == AV_NOPTS_VALUE || stream.duration == AV_NOPTS_VALUE)
        return end;
    const std::int64_t mediaEnd = whole.toFrames(first->pts) + whole.toFrames(stream.duration);
    const std::int64_t tolerance = stream.codecpar->sample_rate * editListToleranceMilliseconds / 1000;
    return std::abs(mediaEnd - end) <= tolerance ? mediaEnd : end;
}

// The demuxer takes what is left of a WAV file that was cut off for the whole.
std::optional<std::int64_t> promisedWavFrames(const Container& container, ByteSource& source) {
    const AVCodecParameters& parameters = *container.stream().codecpar;
    const std::int64_t frameSize = parameters.block_align;
    const bool pcm = av_get_exact_bits_per_sample(parameters.codec_id) > 0;
    if (std::strcmp(container.context().iformat->name, "wav") != 0 || !pcm || frameSize <= 0)
        return std::nullopt;
    const auto bytes = brokenWavPromise(source);
    return bytes ? std::optional(*bytes / frameSize) : std::nullopt;
}

} // namespace

DecoderModule::Examined examineFile(ByteSource& source) {
    Container container;
    if (auto error = container.open(source))
        return {std::nullopt, *std::move(error)};

    LengthFinder length(container);
    if (!container.openCodec() || !length.readFirstPacket())
        return {std::nullopt, container.failure().value_or(mediaError(
                                  MediaErrorCode::notAudio, "The file holds no audio that can be played."))};

    const AVCodecParameters& parameters = *container.stream().codecpar;
    AudioFileInfo info;
    info.format = {decodedSampleFormat(static_cast<AVSampleFormat>(parameters.format)),
                   static_cast<std::uint32_t>(parameters.sample_rate),
                   static_cast<std::uint32_t>(parameters.ch_layout.nb_channels)};
    info.title = readTag(container.context(), container.stream(), "title");
    info.album = readTag(container.context(), container.stream(), "album");
    info.artist = readTag(container.context(), container.stream(), "artist");

    const auto tag = readGaplessTag(container, source, length.firstPacketPosition());
    const bool mp3 = parameters.codec_id == AV_CODEC_ID_MP3;
    info.firstFrame = tag && mp3 ? tag->delay + mp3DecoderDelay : length.origin();
    std::optional<std::int64_t> end = promisedWavFrames(container, source);
    if (!end)
        end = length.end();
    if (container.failure())
        return {std::nullopt, *container.failure()};
    if (end && !tag && isMpeg4(container.context()))
        end = unroundedEnd(*end, source);
    if (tag && tag->recording)
        end = end ? std::min(*end, info.firstFrame + *tag->recording) : info.firstFrame + *tag->recording;
    else if (tag && mp3 && end)
        end = *end - std::max<std::int64_t>(0, tag->padding - mp3DecoderDelay);
    const std::int64_t most = longestSeconds * parameters.sample_rate;
    if (end && *end > info.firstFrame && *end - info.firstFrame <= most)
        info.frames = *end - info.firstFrame;
    return {std::move(info), {}};
}

} // namespace tarn
