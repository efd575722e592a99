#pragma once

#include <mutex>

#include "decoder/Decoder.h"

namespace tarn {

/// Loads the decoder module when it is first needed: its libraries are the largest thing in the process, and
/// a service that has never seen a file does without them. Any thread may call.
class DecoderLoader {
public:
    /// Null when the module cannot be loaded (one error line says why; the next call tries again). Once
    /// loaded it stays.
    const DecoderModule* load();

private:
    std::mutex mutex_;
    const DecoderModule* module_ = nullptr;
};

} // namespace tarn
