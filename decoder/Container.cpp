#include "decoder/Container.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "decoder/CodedPcm.h"
#include "decoder/KnownFormat.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr int ioBufferSize = 32 * 1024;
constexpr std::int64_t probeBytes = 1 << 20;
constexpr std::int64_t probeMicroseconds = 5'000'000;
constexpr std::int64_t farthestFrame = std::int64_t{1}
                                       << 52; // so that sums of what a file claims cannot overflow
constexpr int mostStreams = 32;
constexpr int mostFruitlessReads = 10'000;
constexpr auto openingLimit = 5s; // on a slow board the index of a book of twelve hours takes one
constexpr auto seekingLimit = 5s;
constexpr auto packetLimit = 2s;
constexpr int mostChannels = 8;
constexpr int lowestRate = 1'000;
constexpr int highestRate = 384'000;

constexpr char formats[] = "wav,w64,aiff,caf,flac,mov,aac,mp3,ogg,matroska,webm,wv,ape,tta,au";
constexpr char codecs[] = "mp3float,mp3,mp2float,mp2,mp1float,mp1,aac,alac,flac,vorbis,opus,wavpack,ape,tta,"
                          "pcm_u8,pcm_s8,pcm_s16le,pcm_s16be,pcm_s24le,pcm_s24be,pcm_s32le,pcm_s32be,"
                          "pcm_f32le,pcm_f32be,pcm_f64le,pcm_f64be,pcm_alaw,pcm_mulaw,adpcm_ms,"
                          "adpcm_ima_wav,adpcm_ima_qt";

int refuseToOpen(AVFormatContext*, AVIOContext**, const char*, int, AVDictionary**) { return AVERROR(EPERM); }

Error readingError(std::int64_t number) {
    return mediaError(MediaErrorCode::cannotRead, "The file could not be read.",
                      std::strerror(static_cast<int>(number)));
}

// The decoders that FFmpeg prefers for layers I and II round to 16 bits.
const AVCodec* decoderFor(AVCodecID id) {
    const AVCodec* precise = nullptr;
    if (id == AV_CODEC_ID_MP1 || id == AV_CODEC_ID_MP2)
        precise = avcodec_find_decoder_by_name(id == AV_CODEC_ID_MP1 ? "mp1float" : "mp2float");
    return precise != nullptr ? precise : avcodec_find_decoder(id);
}

} // namespace

std::string ffmpegErrorText(int number) {
    char text[AV_ERROR_MAX_STRING_SIZE] = {};
    av_strerror(number, text, sizeof text);
    return text;
}

int Container::readBytes(void* self, std::uint8_t* into, int size) {
    auto& container = *static_cast<Container*>(self);
    if (container.limit_.over()) {
        container.readError_ = ETIMEDOUT;
        return AVERROR(EIO);
    }
    const std::int64_t count = container.source_->read(container.offset_, reinterpret_cast<std::byte*>(into),
                                                       static_cast<std::size_t>(size));
    if (count > 0) {
        container.patch(container.offset_, into, count);
        container.offset_ += count;
        return static_cast<int>(count);
    }
    if (count == 0)
        return AVERROR_EOF;
    container.readError_ = -count;
    return AVERROR(EIO);
}

void Container::patch(std::int64_t offset, std::uint8_t* bytes, std::int64_t count) const {
    for (const Patch& patch : patches_)
        for (std::size_t i = 0; i < patch.bytes.size(); ++i)
            if (const std::int64_t at = patch.offset + static_cast<std::int64_t>(i) - offset;
                at >= 0 && at < count)
                bytes[at] = static_cast<std::uint8_t>(patch.bytes[i]);
}

std::int64_t Container::seekBytes(void* self, std::int64_t offset, int whence) {
    auto& container = *static_cast<Container*>(self);
    const std::int64_t size = container.source_->size();
    switch (whence & ~AVSEEK_FORCE) {
    case AVSEEK_SIZE:
        return size;
    case SEEK_SET:
        break;
    case SEEK_CUR:
        offset += container.offset_;
        break;
    case SEEK_END:
        offset += size;
        break;
    default:
        return AVERROR(EINVAL);
    }
    if (offset < 0)
        return AVERROR(EINVAL);
    return container.offset_ = offset;
}

Error Container::openingError(int number) const {
    if (readError_ != 0)
        return readingError(readError_);
    return mediaError(MediaErrorCode::notAudio, "The file holds no audio that can be played.",
                      ffmpegErrorText(number));
}

// A hostile file must not make us open another, or take all the time and memory there is.
void Container::prepare(AVFormatContext& context, const AVInputFormat* format) {
    io_.reset(avio_alloc_context(static_cast<unsigned char*>(av_malloc(ioBufferSize)), ioBufferSize, 0, this,
                                 readBytes, nullptr, seekBytes));
    context.pb = io_.get();
    context.flags |= AVFMT_FLAG_CUSTOM_IO;
    context.io_open = refuseToOpen;
    context.probesize = probeBytes;
    context.max_analyze_duration = probeMicroseconds;
    context.max_streams = mostStreams;
    context.protocol_whitelist = av_strdup("");
    context.format_whitelist = av_strdup(formats);
    context.codec_whitelist = av_strdup(codecs);
    const bool wav = format != nullptr && av_match_name(format->name, "wav,w64") != 0;
    if (wav && !mayBeCodedAudio(*source_))
        context.max_probe_packets = 1;
}

std::optional<Error> Container::openHeader(ByteSource& source, std::int64_t largestPicture) {
    source_ = &source;
    limit_.start(openingLimit);
    patches_ = hidePictures(source, largestPicture);
    packet_.reset(av_packet_alloc());
    AVFormatContext* context = avformat_alloc_context();
    const AVInputFormat* const format = knownFormat(source);
    prepare(*context, format);

    AVDictionary* options = nullptr;
    av_dict_set(&options, "ignore_chapters", "1", 0); // spares a walk through the text track of an audio book
    const int result = avformat_open_input(&context, "", format, &options);
    av_dict_free(&options);
    if (result < 0) // has freed the context
        return openingError(result);
    context_.reset(context);
    return std::nullopt;
}

std::optional<Error> Container::open(ByteSource& source) {
    if (auto error = openHeader(source, 0))
        return error;
    if (const int result = avformat_find_stream_info(context_.get(), nullptr); result < 0)
        return openingError(result);
    return chooseStream();
}

bool Container::isNamed(const char* name) const { return av_match_name(name, context_->iformat->name) != 0; }

std::optional<Error> Container::chooseStream() {
    const int index = av_find_best_stream(context_.get(), AVMEDIA_TYPE_AUDIO, -1, -1, nullptr, 0);
    if (index < 0)
        return openingError(index);
    stream_ = context_->streams[index];
    for (unsigned i = 0; i < context_->nb_streams; ++i)
        if (context_->streams[i] != stream_)
            context_->streams[i]->discard = AVDISCARD_ALL;

    const AVCodecParameters& parameters = *stream_->codecpar;
    if (parameters.sample_rate < lowestRate || parameters.sample_rate > highestRate ||
        parameters.ch_layout.nb_channels < 1 || parameters.ch_layout.nb_channels > mostChannels)
        return mediaError(MediaErrorCode::notAudio, "The file's sample rate or channels are out of range.");
    return std::nullopt;
}

AVPacket* Container::next() {
    limit_.start(packetLimit);
    for (int attempt = 0; attempt < mostFruitlessReads; ++attempt) {
        av_packet_unref(packet_.get());
        const int result = av_read_frame(context_.get(), packet_.get());
        if (readError_ != 0) {
            failure_ = readingError(readError_);
            return nullptr;
        }
        if (result == AVERROR(EAGAIN))
            continue;
        if (result < 0)
            return nullptr;
        if (packet_->stream_index == stream_->index && packet_->size > 0) // an empty one would end the codec
            return packet_.get();
    }
    failure_ = mediaError(MediaErrorCode::damaged, "The file has lost its audio.");
    return nullptr;
}

bool Container::seek(std::int64_t time) {
    limit_.start(seekingLimit);
    return av_seek_frame(context_.get(), stream_->index, time, AVSEEK_FLAG_BACKWARD) >= 0;
}

bool Container::seekToByte(std::int64_t offset) {
    limit_.start(seekingLimit);
    return av_seek_frame(context_.get(), stream_->index, offset, AVSEEK_FLAG_BYTE) >= 0;
}

FfmpegPointer<AVCodecContext> Container::openCodec() {
    const AVCodec* codec = decoderFor(stream_->codecpar->codec_id);
    if (codec == nullptr)
        return nullptr;
    FfmpegPointer<AVCodecContext> context(avcodec_alloc_context3(codec));
    if (avcodec_parameters_to_context(context.get(), stream_->codecpar) < 0)
        return nullptr;
    context->pkt_timebase = {1, stream_->codecpar->sample_rate}; // packets are stamped anew, in frames
    context->thread_count = 1;
    context->flags2 |= AV_CODEC_FLAG2_SKIP_MANUAL; // what encoders added is cut by our own count
    context->codec_whitelist = av_strdup(codecs);
    if (avcodec_open2(context.get(), codec, nullptr) < 0)
        return nullptr;
    return context;
}

AVSampleFormat Container::sampleFormat() {
    const AVCodecParameters& parameters = *stream_->codecpar;
    const auto found = static_cast<AVSampleFormat>(parameters.format);
    if (found != AV_SAMPLE_FMT_NONE && parameters.codec_id != AV_CODEC_ID_MP1 &&
        parameters.codec_id != AV_CODEC_ID_MP2)
        return found;
    const auto codec = openCodec();
    return codec ? codec->sample_fmt : AV_SAMPLE_FMT_NONE;
}

std::int64_t Container::toFrames(std::int64_t time) const {
    const std::int64_t frames = av_rescale_q(time, stream_->time_base, {1, stream_->codecpar->sample_rate});
    return std::clamp(frames, -farthestFrame, farthestFrame);
}

std::int64_t Container::fromFrames(std::int64_t frames) const {
    return av_rescale_q(frames, {1, stream_->codecpar->sample_rate}, stream_->time_base);
}

} // namespace tarn
