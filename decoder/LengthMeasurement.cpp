#include "decoder/LengthMeasurement.h"

#include <algorithm>

#include "decoder/Gapless.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
constexpr auto longestStep = 100ms;

} // namespace

LengthMeasurement::LengthMeasurement(ByteSource& source, const AudioFileInfo& info)
    : source_(source), firstFrame_(info.firstFrame) {}

std::optional<Error> LengthMeasurement::open() {
    if (auto error = container_.open(source_))
        return error;
    length_.emplace(container_, source_);
    if (length_->readFirstPacket())
        return std::nullopt;
    return container_.failure().value_or(
        mediaError(MediaErrorCode::notAudio, "The file has lost its audio."));
}

LengthMeasurement::State LengthMeasurement::step() {
    const WorkLimit limit(longestStep);
    if (!length_)
        if (auto error = open()) {
            error_ = *std::move(error);
            return State::failed;
        }
    if (!length_->readOn(limit))
        return State::more;
    if (container_.failure()) {
        error_ = *container_.failure();
        return State::failed;
    }
    std::int64_t end = length_->endOfRead();
    if (const auto tag = readGaplessTag(container_, source_, length_->firstPacketPosition()))
        end = endOfRecording(end, firstFrame_, *tag, container_.stream().codecpar->codec_id);
    frames_ = std::max<std::int64_t>(0, end - firstFrame_);
    return State::done;
}

} // namespace tarn
