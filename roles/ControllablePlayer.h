#pragma once

#include "roles/PlaybackState.h"

namespace tarn {

/// A queue player as the media controls of the system see it: beside its remote commands, what it does at the
/// moment, and what they may set.
class ControllablePlayer {
public:
    virtual ~ControllablePlayer() = default;

    /// Any thread; never blocks.
    virtual PlaybackState playback() const = 0;

    /// Plays at `rate`. May wait for the audio session for up to 17 seconds, so only the thread that delivers
    /// remote commands calls it. False when the rate could not be set in this time.
    virtual bool setRate(float rate) = 0;
};

} // namespace tarn
