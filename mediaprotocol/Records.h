#pragma once

#include <cstdint>
#include <optional>

#include "mediaprotocol/AudioFileInfo.h"
#include "mediaprotocol/FixedText.h"
#include "pcm/PcmFormat.h"
#include "roles/Error.h"

namespace tarn {

/// A format in a message.
struct FormatRecord {
    std::uint32_t sample = 0;
    std::uint32_t rate = 0;
    std::uint32_t channels = 0;

    static FormatRecord of(const PcmFormat& format);

    /// None when there can be no such format.
    std::optional<PcmFormat> checked() const;
};

/// What an AudioFileInfo says besides its texts.
struct InfoRecord {
    enum class Length : std::uint32_t { unknown, exact, estimated };

    FormatRecord format;
    Length length = Length::unknown; ///< what `frames` is
    std::int64_t firstFrame = 0;
    std::int64_t frames = 0;

    static InfoRecord of(const AudioFileInfo& info);

    /// None when no file can be like that.
    std::optional<AudioFileInfo> checked() const;
};

/// The texts of an AudioFileInfo.
struct TagsRecord {
    FixedText<1024> title;
    FixedText<1024> album;
    FixedText<1024> artist;
    std::uint32_t zero = 0;

    static TagsRecord of(const AudioFileInfo& info);

    /// False when one of them is no text; `info` may hold some of the others then.
    [[nodiscard]] bool copyTo(AudioFileInfo& info) const;
};

/// Why a file cannot be read or played. Its domain is that of media errors.
struct ErrorRecord {
    std::int64_t code = 0; ///< 0: no error
    FixedText<252> description;
    FixedText<252> reason;

    static ErrorRecord of(const Error& error);

    /// Whatever stands in it, as an error that can be told to a client.
    Error toError() const;
};

} // namespace tarn
