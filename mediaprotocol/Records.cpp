#include "mediaprotocol/Records.h"

#include <type_traits>

#include "mediaprotocol/MediaError.h"

namespace tarn {

namespace {

constexpr std::uint32_t lowestRate = 1'000;
constexpr std::uint32_t highestRate = 768'000;
constexpr std::uint32_t mostChannels = 32;
constexpr std::int64_t farthestFrame = std::int64_t{1} << 53;

// What lies between the members of a message would tell the other process of this one's memory.
static_assert(std::has_unique_object_representations_v<InfoRecord> &&
              std::has_unique_object_representations_v<TagsRecord> &&
              std::has_unique_object_representations_v<ErrorRecord>);

std::optional<std::string> textIn(const Error& error, const char* key) {
    const auto found = error.userInfo.find(key);
    return found == error.userInfo.end() ? std::nullopt : std::optional(found->second);
}

bool isFrame(std::int64_t frame) { return frame >= -farthestFrame && frame <= farthestFrame; }

} // namespace

FormatRecord FormatRecord::of(const PcmFormat& format) {
    return {static_cast<std::uint32_t>(format.sample), format.rate, format.channels};
}

std::optional<PcmFormat> FormatRecord::checked() const {
    if (sample > static_cast<std::uint32_t>(SampleFormat::f32) || rate < lowestRate || rate > highestRate ||
        channels < 1 || channels > mostChannels)
        return std::nullopt;
    return PcmFormat{static_cast<SampleFormat>(sample), rate, channels};
}

InfoRecord InfoRecord::of(const AudioFileInfo& info) {
    InfoRecord record{FormatRecord::of(info.format), Length::unknown, info.firstFrame, 0};
    if (info.frames || info.estimatedFrames) {
        record.length = info.frames ? Length::exact : Length::estimated;
        record.frames = info.frames ? *info.frames : *info.estimatedFrames;
    }
    return record;
}

std::optional<AudioFileInfo> InfoRecord::checked() const {
    const auto known = format.checked();
    if (!known || known->sample == SampleFormat::s24In32 || !isFrame(firstFrame) || !isFrame(frames) ||
        frames < 0 || length > Length::estimated)
        return std::nullopt;
    AudioFileInfo info;
    info.format = *known;
    info.firstFrame = firstFrame;
    if (length == Length::exact)
        info.frames = frames;
    else if (length == Length::estimated)
        info.estimatedFrames = frames;
    return info;
}

TagsRecord TagsRecord::of(const AudioFileInfo& info) {
    TagsRecord tags;
    tags.title.set(info.title);
    tags.album.set(info.album);
    tags.artist.set(info.artist);
    return tags;
}

bool TagsRecord::copyTo(AudioFileInfo& info) const {
    if (!title.valid() || !album.valid() || !artist.valid())
        return false;
    info.title = title.text();
    info.album = album.text();
    info.artist = artist.text();
    return true;
}

ErrorRecord ErrorRecord::of(const Error& error) {
    ErrorRecord record;
    record.code = error.code;
    record.description.set(textIn(error, localizedDescriptionKey));
    record.reason.set(textIn(error, localizedFailureReasonKey));
    return record;
}

Error ErrorRecord::toError() const {
    const auto last = static_cast<std::int64_t>(MediaErrorCode::noDecoder);
    if (code < 1 || code > last || !description.valid() || !reason.valid())
        return mediaError(MediaErrorCode::damaged, "The file cannot be played.");
    return mediaError(static_cast<MediaErrorCode>(code),
                      description.text().value_or("The file cannot be played."), reason.text().value_or(""));
}

} // namespace tarn
