#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "tests/support/ChildProcess.h"
#include "tests/system/controls/PrivateBus.h"

namespace tarn {

/// Hears what the media player tells everybody on the bus, in one line each: "Player: PlaybackStatus
/// Metadata" for changed properties of that interface, "Seeked 90000000", "appeared" and "vanished" for its
/// name.
class SignalListener final {
public:
    explicit SignalListener(const PrivateBus& bus, const std::string& name = "org.mpris.MediaPlayer2.tarnd");

    /// The next line; none when the limit passed without one.
    std::optional<std::string> next(std::chrono::milliseconds limit = std::chrono::seconds(10));

    /// Reads lines up to `last`, which is not among those returned.
    std::vector<std::string> until(const std::string& last);

private:
    ChildProcess monitor_;
};

} // namespace tarn
