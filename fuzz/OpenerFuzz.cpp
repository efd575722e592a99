#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <span>

#include "decoder/Examination.h"
#include "decoder/FileDecoder.h"

namespace {

/// A file in memory, which breaks when it makes us go round in circles.
class MemorySource final : public tarn::ByteSource {
public:
    explicit MemorySource(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

    std::int64_t size() const override { return static_cast<std::int64_t>(bytes_.size()); }

    std::int64_t read(std::int64_t offset, std::byte* into, std::size_t size) override {
        if (++reads_ > mostReads)
            return -EIO;
        if (offset < 0 || offset >= this->size())
            return 0;
        const auto rest = bytes_.subspan(static_cast<std::size_t>(offset));
        size = std::min(size, rest.size());
        std::memcpy(into, rest.data(), size);
        return static_cast<std::int64_t>(size);
    }

private:
    static constexpr int mostReads = 10'000;

    const std::span<const std::uint8_t> bytes_;
    int reads_ = 0;
};

void check(bool holds) {
    if (!holds)
        std::abort();
}

void readSome(tarn::FileDecoder& decoder, const tarn::PcmFormat& format) {
    constexpr std::size_t mostFrames = 100'000;
    tarn::PcmBuffer buffer;
    while (buffer.frames < mostFrames) {
        const tarn::Decoder::State state = decoder.read(buffer, 4'096);
        check(buffer.bytes.size() == buffer.frames * format.bytesPerFrame());
        if (state != tarn::Decoder::State::more)
            return;
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    av_log_set_level(AV_LOG_QUIET);
    av_max_alloc(64u << 20);
    MemorySource source({data, size});
    const auto examined = tarn::examineFile(source);
    check(examined.info.has_value() != !examined.error.domain.empty());
    if (!examined.info)
        return 0;
    const tarn::AudioFileInfo& info = *examined.info;
    check(!info.frames || *info.frames > 0);
    check(info.format.channels >= 1 && info.format.channels <= 8);

    tarn::FileDecoder decoder(source, info);
    if (decoder.open())
        return 0;
    readSome(decoder, info.format);
    decoder.seek(info.frames.value_or(50'000) / 2);
    readSome(decoder, info.format);
    return 0;
}
