#include "decoder/MpegEstimate.h"

#include <string>

#include "decoder/Bytes.h"
#include "decoder/MpegFrame.h"

namespace tarn {

namespace {

constexpr int places = 64;
constexpr std::size_t sampleSize = std::size_t{8} * 1024;
constexpr int framesOfARun = 3;

MpegFrameRun firstRun(std::string_view piece) {
    for (std::size_t at = piece.find('\xFF'); at != piece.npos; at = piece.find('\xFF', at + 1))
        if (const MpegFrameRun run = readMpegFrames(piece.substr(at)); run.frames >= framesOfARun)
            return run;
    return {};
}

} // namespace

// The places are spread evenly over the bytes, so it is the samples in a byte that are to be averaged.
std::optional<std::int64_t> estimateMpegSamples(ByteSource& source, std::int64_t begin) {
    const std::int64_t size = source.size() - begin;
    double sum = 0;
    int found = 0;
    for (int place = 0; place < places; ++place) {
        const MpegFrameRun run = firstRun(readPiece(source, begin + size / places * place, sampleSize));
        if (run.frames == 0)
            continue;
        sum += static_cast<double>(run.samples) / static_cast<double>(run.bytes);
        ++found;
    }
    if (found < places / 8)
        return std::nullopt;
    // What holds no frames at some places holds none in between either: a tag, a picture, damage.
    return static_cast<std::int64_t>(sum / places * static_cast<double>(size));
}

} // namespace tarn
