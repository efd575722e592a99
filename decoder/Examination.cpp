#include "decoder/Examination.h"

#include <algorithm>
#include <cstdlib>

#include "decoder/Container.h"
#include "decoder/Gapless.h"
#include "decoder/LengthFinder.h"
#include "decoder/Mp4Atoms.h"
#include "decoder/Samples.h"
#include "decoder/Tags.h"
#include "decoder/WavPromise.h"

namespace tarn {

namespace {

constexpr std::int64_t longestSeconds = 365L * 24 * 3600; // whatever claims more does not know
constexpr std::int64_t editListToleranceMilliseconds = 2;

// An edit list tells the end in coarse units. Where it means the end of the media, that one is exact.
std::int64_t unroundedEnd(std::int64_t end, const Container& container, std::int64_t first,
                          ByteSource& source) {
    const auto duration = mp4MediaDuration(source, container.stream().id);
    if (!duration || *duration == 0)
        return end;
    const std::int64_t mediaEnd = first + container.toFrames(*duration);
    const std::int64_t tolerance =
        container.stream().codecpar->sample_rate * editListToleranceMilliseconds / 1000;
    return std::abs(mediaEnd - end) <= tolerance ? mediaEnd : end;
}

// The demuxer takes what is left of a WAV file that was cut off for the whole.
std::optional<std::int64_t> promisedWavFrames(const Container& container, ByteSource& source) {
    const AVCodecParameters& parameters = *container.stream().codecpar;
    const std::int64_t frameSize = parameters.block_align;
    const bool pcm = av_get_exact_bits_per_sample(parameters.codec_id) > 0;
    if (!container.isNamed("wav") || !pcm || frameSize <= 0)
        return std::nullopt;
    const auto bytes = brokenWavPromise(source);
    return bytes ? std::optional(*bytes / frameSize) : std::nullopt;
}

Error noAudio(const Container& container) {
    return container.failure().value_or(
        mediaError(MediaErrorCode::notAudio, "The file holds no audio that can be played."));
}

std::optional<std::int64_t> saneLength(std::optional<std::int64_t> end, const AudioFileInfo& info) {
    if (!end || *end <= info.firstFrame || *end - info.firstFrame > longestSeconds * info.format.rate)
        return std::nullopt;
    return *end - info.firstFrame;
}

// Where the audible part begins, and how long it is.
void findExtent(Container& container, ByteSource& source, LengthFinder& length, AudioFileInfo& info) {
    const AVCodecID codec = container.stream().codecpar->codec_id;
    const auto tag = readGaplessTag(container, source, length.firstPacketPosition());
    info.firstFrame = length.origin();
    if (tag && container.isNamed("caf"))
        info.firstFrame += tag->delay;
    else if (tag && codec == AV_CODEC_ID_MP3)
        info.firstFrame = tag->delay + mp3DecoderDelay;
    std::optional<std::int64_t> end = promisedWavFrames(container, source);
    if (!end)
        end = length.end();
    if (end && tag)
        end = endOfRecording(*end, info.firstFrame, *tag, codec);
    else if (tag && tag->recording)
        end = info.firstFrame + *tag->recording;
    else if (end && container.isNamed("mp4"))
        end = unroundedEnd(*end, container, length.timeline().first(), source);
    info.frames = saneLength(end, info);
    if (!info.frames)
        info.estimatedFrames = saneLength(length.estimate(), info);
}

} // namespace

ExaminedFile examineFile(ByteSource& source) {
    Container container;
    if (auto error = container.open(source))
        return {std::nullopt, *std::move(error)};
    LengthFinder length(container, source);
    const AVSampleFormat samples = container.sampleFormat();
    if (samples == AV_SAMPLE_FMT_NONE || !length.readFirstPacket())
        return {std::nullopt, noAudio(container)};

    const AVCodecParameters& parameters = *container.stream().codecpar;
    AudioFileInfo info;
    info.format = {decodedSampleFormat(samples), static_cast<std::uint32_t>(parameters.sample_rate),
                   static_cast<std::uint32_t>(parameters.ch_layout.nb_channels)};
    readTags(container, source, info);
    findExtent(container, source, length, info);
    if (container.failure())
        return {std::nullopt, *container.failure()};
    return {std::move(info), {}};
}

} // namespace tarn
