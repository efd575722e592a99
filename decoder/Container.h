#pragma once

#include <optional>
#include <vector>

#include "decoder/ByteSource.h"
#include "decoder/Ffmpeg.h"
#include "decoder/Pictures.h"
#include "decoder/WorkLimit.h"

namespace tarn {

/// An audio file taken apart into the packets of its audio stream.
///
/// The file may be hostile: it is read through `source` alone, nothing that it names is opened, and only
/// audio formats and codecs are tried, each with limits.
class Container {
public:
    Container() = default;
    Container(const Container&) = delete;
    Container& operator=(const Container&) = delete;

    /// Why opening failed; the container is of no use then.
    std::optional<Error> open(ByteSource& source);

    /// Reads what the file says of itself and looks at no audio: context() can be used then, nothing else.
    /// Pictures larger than `largestPicture` are left out.
    std::optional<Error> openHeader(ByteSource& source, std::int64_t largestPicture);

    AVFormatContext& context() const { return *context_; }
    AVStream& stream() const { return *stream_; }

    /// Is `name` one of the names that FFmpeg has for this container?
    bool isNamed(const char* name) const;

    /// The next packet of the audio stream, never an empty one; null at the end or on failure().
    AVPacket* next();

    /// Goes to the last packet that begins at or before `time`, in the stream's time base. False when the
    /// file cannot be moved in.
    bool seek(std::int64_t time);

    /// Goes to a packet that begins at byte `offset` of the file.
    bool seekToByte(std::int64_t offset);

    /// Why next() or open() stopped before the end of the file.
    const std::optional<Error>& failure() const { return failure_; }

    /// Opens the codec of the audio stream.
    FfmpegPointer<AVCodecContext> openCodec();

    /// What that codec makes; AV_SAMPLE_FMT_NONE when it cannot be opened. FFmpeg has opened a codec to look
    /// at the stream, so most often this is known; but in a file of layer II it was the one for layer III.
    AVSampleFormat sampleFormat();

    /// `time` of the stream in sample frames, rounded, and kept within 52 bits.
    std::int64_t toFrames(std::int64_t time) const;
    std::int64_t fromFrames(std::int64_t frames) const;

private:
    static int readBytes(void* self, std::uint8_t* into, int size);
    void patch(std::int64_t offset, std::uint8_t* bytes, std::int64_t count) const;
    static std::int64_t seekBytes(void* self, std::int64_t offset, int whence);

    void prepare(AVFormatContext& context, const AVInputFormat* format);
    std::optional<Error> chooseStream();
    Error openingError(int number) const;

    ByteSource* source_ = nullptr;
    std::vector<Patch> patches_;
    std::int64_t offset_ = 0;
    WorkLimit limit_; // of the call into FFmpeg that is going on
    std::int64_t readError_ = 0;
    std::optional<Error> failure_;
    FfmpegPointer<AVIOContext> io_;
    FfmpegPointer<AVFormatContext> context_;
    AVStream* stream_ = nullptr;
    FfmpegPointer<AVPacket> packet_;
};

} // namespace tarn
