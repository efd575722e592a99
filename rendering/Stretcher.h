#pragma once

#include <memory>
#include <vector>

#include "pcm/PcmBuffer.h"
#include "pcm/PcmFormat.h"

namespace tarn {

/// Plays frames faster or slower without changing their pitch.
///
/// Runs one or more stages, none of which changes the speed by more than a factor of two: there the library
/// is at its best. Each is steered so that what comes out stays where it belongs in time, however long it
/// runs.
class Stretcher {
public:
    static constexpr double slowest = 1.0 / 32;
    static constexpr double fastest = 32;

    /// `speed` from slowest to fastest.
    Stretcher(const PcmFormat& format, double speed);
    ~Stretcher();

    /// Takes all of `in` and appends what comes out to `out`.
    void stretch(const PcmBuffer& in, PcmBuffer& out);

    /// Appends what is still inside; nothing may follow.
    void drain(PcmBuffer& out);

private:
    class Stage;

    void run(const PcmBuffer* in, PcmBuffer& out);

    const PcmFormat format_;
    std::vector<std::unique_ptr<Stage>> stages_;
    std::vector<PcmBuffer> between_;
};

} // namespace tarn
