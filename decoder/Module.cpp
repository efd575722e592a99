#include "decoder/Converter.h"
#include "decoder/Examination.h"
#include "decoder/FileDecoder.h"

namespace tarn {

namespace {

constexpr std::size_t largestAllocation = 64u << 20;

class FfmpegDecoderModule final : public DecoderModule {
public:
    FfmpegDecoderModule() {
        av_max_alloc(largestAllocation);
        av_log_set_level(AV_LOG_QUIET); // what a broken file provokes is told by our own errors
    }

    Examined examine(ByteSource& source) const override { return examineFile(source); }

    Opened open(ByteSource& source, const AudioFileInfo& info) const override {
        auto decoder = std::make_unique<FileDecoder>(source, info);
        if (auto error = decoder->open())
            return {nullptr, *std::move(error)};
        return {std::move(decoder), {}};
    }

    std::unique_ptr<SampleConverter> makeConverter(const PcmFormat& from,
                                                   const PcmFormat& to) const override {
        return std::make_unique<Converter>(from, to);
    }
};

} // namespace

extern "C" [[gnu::visibility("default")]] const DecoderModule* tarnDecoderModule1() {
    static const FfmpegDecoderModule module;
    return &module;
}

} // namespace tarn
