#pragma once

#include <optional>

#include "decoder/ByteSource.h"
#include "decoder/Ffmpeg.h"

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

    enum class EditLists { obeyed, ignored };

    /// Why opening failed; the container is of no use then. An edit list says which part of an MP4 file is
    /// the recording.
    std::optional<Error> open(ByteSource& source, EditLists editLists = EditLists::obeyed);

    AVFormatContext& context() const { return *context_; }
    AVStream& stream() const { return *stream_; }

    /// The next packet of the audio stream; null at the end or on failure().
    AVPacket* next();

    /// Goes to the last packet that begins at or before `time`, in the stream's time base. False when the
    /// file cannot be moved in.
    bool seek(std::int64_t time);

    /// Why next() or open() stopped before the end of the file.
    const std::optional<Error>& failure() const { return failure_; }

    /// Opens the codec of the audio stream.
    FfmpegPointer<AVCodecContext> openCodec();

    /// `time` of the stream in sample frames, rounded, and kept within 52 bits.
    std::int64_t toFrames(std::int64_t time) const;
    std::int64_t fromFrames(std::int64_t frames) const;

private:
    static int readBytes(void* self, std::uint8_t* into, int size);
    static std::int64_t seekBytes(void* self, std::int64_t offset, int whence);

    void prepare(AVFormatContext& context);
    std::optional<Error> chooseStream();
    Error openingError(int number) const;

    ByteSource* source_ = nullptr;
    std::int64_t offset_ = 0;
    std::int64_t readError_ = 0;
    std::optional<Error> failure_;
    FfmpegPointer<AVIOContext> io_;
    FfmpegPointer<AVFormatContext> context_;
    AVStream* stream_ = nullptr;
    FfmpegPointer<AVPacket> packet_;
};

} // namespace tarn
