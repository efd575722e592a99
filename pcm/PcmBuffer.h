#pragma once

#include <cstddef>
#include <vector>

namespace tarn {

/// Frames on their way to the output. In the simulated engine `bytes` tells what they are instead of holding
/// them.
struct PcmBuffer {
    std::size_t frames = 0;
    std::vector<std::byte> bytes;

    /// Copies `count` frames of `frameSize` bytes each behind what is there.
    void append(const std::byte* from, std::size_t count, std::size_t frameSize) {
        bytes.insert(bytes.end(), from, from + count * frameSize);
        frames += count;
    }

    void clear() {
        frames = 0;
        bytes.clear();
    }
};

} // namespace tarn
