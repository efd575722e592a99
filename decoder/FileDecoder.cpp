#include "decoder/FileDecoder.h"

#include <algorithm>
#include <limits>

#include "decoder/Samples.h"
#include "decoder/TtaLength.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr int mostBadPackets = 64;
constexpr int mostRetries = 3;
constexpr int toleratedShortfallParts = 10; // a tenth of a second
constexpr std::int64_t longestHoleSeconds = 10;
constexpr auto longestRead = 250ms; // of processor time

// How far before its target a decoder must begin so that nothing of its start is left in what is heard.
std::int64_t prerollOf(const AVCodecParameters& parameters) {
    switch (parameters.codec_id) {
    case AV_CODEC_ID_MP3: // frames lend bytes to later ones, at low rates over a dozen of them
        return 24L * 1152;
    case AV_CODEC_ID_MP2:
    case AV_CODEC_ID_MP1:
        return 4L * 1152;
    case AV_CODEC_ID_AAC: // one frame overlaps; spectral replication takes longer to settle
        return parameters.frame_size > 1024 ? 16L * 2048 : 4L * 1024;
    case AV_CODEC_ID_OPUS:
        return 48'000 / 2;
    case AV_CODEC_ID_VORBIS:
        return 4L * 8192;
    default:
        return 0;
    }
}

} // namespace

FileDecoder::FileDecoder(ByteSource& source, const AudioFileInfo& info) : source_(source), info_(info) {}

std::optional<Error> FileDecoder::open() {
    if (auto error = container_.open(source_))
        return error;
    if (info_.frames)
        tellTtaLength(container_, *info_.frames);
    codec_ = container_.openCodec();
    const AVPacket* first = codec_ ? container_.next() : nullptr;
    if (first == nullptr)
        return container_.failure().value_or(
            mediaError(MediaErrorCode::notAudio, "The file holds no audio that can be played."));
    timeline_ = PacketTimeline(container_, *first);
    seeker_.emplace(container_, timeline_, source_, *first);
    frame_.reset(av_frame_alloc());
    end_ = info_.frames ? info_.firstFrame + *info_.frames : std::numeric_limits<std::int64_t>::max();
    seek(0);
    return std::nullopt;
}

void FileDecoder::seek(std::int64_t frame) {
    position_ = info_.firstFrame + std::max<std::int64_t>(0, frame);
    retries_ = 0;
    preroll_ = prerollOf(*container_.stream().codecpar);
    moveTo(position_ - preroll_);
}

void FileDecoder::moveTo(std::int64_t frame) {
    seeker_->begin(std::max(frame, timeline_.first()));
    avcodec_flush_buffers(codec_.get());
    av_frame_unref(frame_.get());
    placed_ = false;
    draining_ = false;
    silence_ = 0;
    badPackets_ = 0;
}

FileDecoder::Step FileDecoder::fail(Error error) {
    error_ = std::move(error);
    return Step::failed;
}

FileDecoder::Step FileDecoder::failDamaged(int result) {
    return fail(mediaError(MediaErrorCode::damaged, "The file is damaged and cannot be played any further.",
                           ffmpegErrorText(result)));
}

// Gives the codec one more packet, or tells it that there is none.
FileDecoder::Step FileDecoder::feed() {
    AVPacket* packet = container_.next();
    if (packet == nullptr && container_.failure())
        return fail(*container_.failure());
    draining_ = packet == nullptr;
    if (packet != nullptr)
        packet->pts = packet->dts = timeline_.begin(*packet).value_or(AV_NOPTS_VALUE);
    const int result = avcodec_send_packet(codec_.get(), packet);
    if (result == AVERROR(ENOMEM) || (result < 0 && ++badPackets_ > mostBadPackets))
        return failDamaged(result);
    return Step::frame;
}

// Makes frame_ the next decoded frame, wherever it lies.
FileDecoder::Step FileDecoder::decode(const WorkLimit& limit) {
    for (;;) {
        if (limit.over() || !seeker_->proceed())
            return Step::unfinished;
        const int result = avcodec_receive_frame(codec_.get(), frame_.get());
        if (result == 0) {
            if (!decodedFormatHolds())
                return fail(mediaError(MediaErrorCode::damaged, "The file changes its format midway."));
            if (placeDecodedFrame())
                return Step::frame;
            continue;
        }
        if (result == AVERROR_EOF)
            return Step::ended;
        if (result != AVERROR(EAGAIN) && ++badPackets_ > mostBadPackets)
            return failDamaged(result);
        if (draining_)
            return Step::ended;
        if (feed() == Step::failed)
            return Step::failed;
    }
}

bool FileDecoder::decodedFormatHolds() const {
    return frame_->sample_rate == static_cast<int>(info_.format.rate) &&
           frame_->ch_layout.nb_channels == static_cast<int>(info_.format.channels) &&
           decodedSampleFormat(static_cast<AVSampleFormat>(frame_->format)) == info_.format.sample;
}

// Finds where frame_ lies. False when it is of no use: before the target, or too far behind it.
bool FileDecoder::placeDecodedFrame() {
    const bool stamped = frame_->pts != AV_NOPTS_VALUE;
    if (!stamped && !placed_)
        return false;
    const std::int64_t stamp = stamped ? frame_->pts : decodedEnd_;
    const bool afterHole = badPackets_ > 0 && stamp > decodedEnd_ &&
                           stamp - decodedEnd_ < longestHoleSeconds * info_.format.rate;
    frameStart_ = placed_ && !afterHole ? decodedEnd_ : stamp;
    badPackets_ = 0;

    // Some containers take a seek to a packet behind its target: begin earlier.
    if (!placed_ && frameStart_ > position_ && position_ > timeline_.first() && retries_ < mostRetries) {
        preroll_ = retries_ + 1 == mostRetries ? position_ : 4 * preroll_ + info_.format.rate;
        const int retries = retries_ + 1;
        moveTo(position_ - preroll_);
        retries_ = retries;
        return false;
    }
    placed_ = true;
    decodedEnd_ = frameStart_ + frame_->nb_samples;
    if (frameStart_ > position_)
        silence_ = std::min(frameStart_ - position_, longestHoleSeconds * info_.format.rate);
    return decodedEnd_ > position_;
}

// Appends what lies at position_ already: of a hole, or of frame_.
std::size_t FileDecoder::take(PcmBuffer& buffer, std::size_t frames) {
    // Compared in 64 bits: where size_t has 32, more may be left of a file than that holds.
    const auto most = std::min(static_cast<std::int64_t>(frames), end_ - position_);
    if (silence_ > 0) {
        const std::int64_t count = std::min(most, silence_);
        buffer.bytes.resize(buffer.bytes.size() +
                            static_cast<std::size_t>(count) * info_.format.bytesPerFrame());
        silence_ -= count;
        position_ = silence_ == 0 ? frameStart_ : position_ + count;
        buffer.frames += static_cast<std::size_t>(count);
        return static_cast<std::size_t>(count);
    }
    if (!placed_ || decodedEnd_ <= position_)
        return 0;
    const std::int64_t count = std::min(most, decodedEnd_ - position_);
    appendInterleaved(*frame_, static_cast<int>(position_ - frameStart_), static_cast<int>(count),
                      info_.format, buffer);
    position_ += count;
    return static_cast<std::size_t>(count);
}

Decoder::State FileDecoder::read(PcmBuffer& buffer, std::size_t maxFrames) {
    const WorkLimit worktime(longestRead);
    const std::size_t limit = buffer.frames + maxFrames;
    while (buffer.frames < limit && position_ < end_) {
        if (take(buffer, limit - buffer.frames) > 0)
            continue;
        switch (decode(worktime)) {
        case Step::frame:
            break;
        case Step::ended:
            return finish();
        case Step::failed:
            return State::failed;
        case Step::unfinished:
            return State::more;
        }
    }
    return position_ < end_ ? State::more : State::ended;
}

// The file has no more packets: is that where it was to end?
Decoder::State FileDecoder::finish() {
    const std::int64_t shortfall = end_ - position_;
    if (!info_.frames || shortfall <= info_.format.rate / toleratedShortfallParts)
        return State::ended;
    error_ = mediaError(MediaErrorCode::truncated, "The file ends before its time.");
    return State::failed;
}

} // namespace tarn
