#pragma once

#include <cstddef>
#include <vector>

namespace tarn {

/// Frames on their way to the output. In the simulated engine `bytes` tells what they are instead of holding
/// them.
struct PcmBuffer {
    std::size_t frames = 0;
    std::vector<std::byte> bytes;

    void clear() {
        frames = 0;
        bytes.clear();
    }
};

} // namespace tarn
