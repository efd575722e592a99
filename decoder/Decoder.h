#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>

#include "decoder/ByteSource.h"
#include "mediaprotocol/AudioFileInfo.h"
#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"
#include "roles/Error.h"

namespace tarn {

/// One file being decoded, from any frame on. Used by one thread.
class Decoder {
public:
    enum class State {
        more,
        ended,  ///< what was appended is the last of the file; it may be nothing
        failed, ///< nothing follows; error() says why
    };

    virtual ~Decoder() = default;

    /// The next read() begins exactly at `frame` of the audible part.
    virtual void seek(std::int64_t frame) = 0;

    /// Appends at most `maxFrames` frames to `buffer`, fewer when that is what is at hand.
    virtual State read(PcmBuffer& buffer, std::size_t maxFrames) = 0;

    /// Meaningful after State::failed.
    virtual const Error& error() const = 0;
};

/// Converts a stream of frames between formats. Used by one thread.
class SampleConverter {
public:
    virtual ~SampleConverter() = default;

    /// Appends to `out` what `in` makes now; the converter holds some frames back.
    virtual void convert(const PcmBuffer& in, PcmBuffer& out) = 0;

    /// Appends what was held back; only reset() may follow.
    virtual void drain(PcmBuffer& out) = 0;

    /// Begins a new stream.
    virtual void reset() = 0;
};

/// Reads audio files, and converts samples. Stateless; any thread may call.
///
/// Everything that knows a media format is behind this interface, so that it can be loaded when it is first
/// needed, or moved into a process of its own. `source` must outlive the decoder.
class DecoderModule {
public:
    struct Examined {
        std::optional<AudioFileInfo> info;
        Error error; // meaningful when there is no info
    };
    struct Opened {
        std::unique_ptr<Decoder> decoder;
        Error error; // meaningful when there is no decoder
    };

    virtual ~DecoderModule() = default;

    /// Reads format, tags and exact length.
    virtual Examined examine(ByteSource& source) const = 0;

    /// `info` is what examine() made of the same file.
    virtual Opened open(ByteSource& source, const AudioFileInfo& info) const = 0;

    virtual std::unique_ptr<SampleConverter> makeConverter(const PcmFormat& from,
                                                           const PcmFormat& to) const = 0;
};

/// What the module exports, under the name in decoderModuleSymbol.
using DecoderModuleFunction = const DecoderModule* (*)();
inline constexpr char decoderModuleSymbol[] = "tarnDecoderModule1";
inline constexpr char decoderModuleFile[] = "libtarn-decoder.so";

} // namespace tarn
