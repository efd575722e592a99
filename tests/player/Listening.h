#pragma once

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "roles/AudioSession.h"
#include "roles/MediaItem.h"
#include "roles/MediaQueuePlayer.h"
#include "simulated/SimulatedPlatform.h"

namespace tarn {

using namespace std::chrono_literals;

/// A player on virtual time, what it reports and what is heard of it.
class Listening {
public:
    explicit Listening(std::uint64_t seed = 1);

    /// A file that is named "a", "b" ... and an item of it, whose reports are kept from now on.
    std::shared_ptr<MediaItem> item(const std::string& name, MediaScript script = {});
    std::shared_ptr<MediaItem> item(const std::string& name, std::chrono::nanoseconds duration);

    /// A player of the items, whose reports are kept from now on.
    MediaQueuePlayer& play(std::vector<std::shared_ptr<MediaItem>> items, float rate = 1);

    void advance(std::chrono::nanoseconds time) { platform.scheduler.advance(time); }
    void settle() { platform.scheduler.runReady(); }

    /// What was reported since the last call, as lines of "seconds: event".
    std::string reports();

    /// What has been heard so far, as lines of "from-to name start..end".
    std::string heard();

    static double seconds(const MediaTime& time) { return time.seconds(); }
    std::string nameOf(const std::shared_ptr<MediaItem>& item) const;

    SimulatedPlatform platform;
    std::shared_ptr<MediaQueuePlayer> player;

private:
    void note(const std::string& event);
    void watch(const std::shared_ptr<MediaItem>& item, const std::string& name);

    std::string reports_;
    std::vector<RegistrationHandle> registrations_;
};

} // namespace tarn
