#pragma once

#include <cstdint>
#include <optional>

#include "decoder/Container.h"
#include "decoder/LengthFinder.h"
#include "mediaprotocol/AudioFileInfo.h"

namespace tarn {

/// Finds the exact length of a file of which examineFile() could only estimate it, by reading all of the file
/// in small steps. Used by one thread, whenever that has nothing better to do; `source` must outlive it.
class LengthMeasurement {
public:
    enum class State { more, done, failed };

    /// `info` is what examineFile() made of the same file.
    LengthMeasurement(ByteSource& source, const AudioFileInfo& info);

    /// Works for a tenth of a second, of processor time.
    State step();

    /// After State::done: what AudioFileInfo::frames is to be.
    std::int64_t frames() const { return frames_; }

    /// After State::failed.
    const Error& error() const { return error_; }

private:
    std::optional<Error> open();

    ByteSource& source_;
    const std::int64_t firstFrame_;
    Container container_;
    std::optional<LengthFinder> length_; // once the file is open
    std::int64_t frames_ = 0;
    Error error_;
};

} // namespace tarn
