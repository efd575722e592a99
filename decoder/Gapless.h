#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include "decoder/Container.h"

namespace tarn {

/// What an encoder says of the silence that it put around the recording, in frames.
struct GaplessTag {
    std::int64_t delay = 0;                ///< before it, the decoder's own delay left out
    std::int64_t padding = 0;              ///< behind it
    std::optional<std::int64_t> recording; ///< its length, where the tag tells
};

/// The text of an iTunSMPB tag: hexadecimal words, the second the delay, the third the padding, the fourth
/// the length of the recording.
std::optional<GaplessTag> parseITunSMPB(std::string_view text);

/// The encoder's field in the Xing or Info frame of an MP3 file, which stands right before the first audio
/// packet at `firstPacket` in `source`.
std::optional<GaplessTag> readLameTag(ByteSource& source, std::int64_t firstPacket);

/// The packet table of a CAF file.
std::optional<GaplessTag> readCafTable(ByteSource& source);

/// The gapless tag that holds for `container`; `firstPacket` is the position of its first packet.
std::optional<GaplessTag> readGaplessTag(const Container& container, ByteSource& source,
                                         std::int64_t firstPacket);

/// Where the recording ends, in a file whose last frame ends at `end` and whose audible part begins at
/// `first`.
std::int64_t endOfRecording(std::int64_t end, std::int64_t first, const GaplessTag& tag, AVCodecID codec);

/// An MP3 decoder puts out this many frames before the first one that was encoded.
inline constexpr std::int64_t mp3DecoderDelay = 529;

} // namespace tarn
