#pragma once

#include <optional>
#include <string>

namespace tarn {

/// What the system shows about what plays. Times in seconds. Everything absent: nothing is playing.
struct NowPlayingInfo {
    std::optional<std::string> title;
    std::optional<double> duration;
    std::optional<double> elapsedTime;
    std::optional<float> playbackRate;
    std::optional<std::string> artist;
    std::optional<std::string> albumTitle;

    bool empty() const { return *this == NowPlayingInfo{}; }
    bool operator==(const NowPlayingInfo&) const = default;
};

/// Publishes now-playing information. One shared instance; any thread may call; no call blocks.
///
/// What was published is shown once its player has told the command center that it has changed.
class NowPlayingService {
public:
    /// Where playback happens; this device is the only one.
    enum class Origin { local };

    /// How a publication combines with the one before: it replaces it whole.
    static constexpr int mergePolicyReplace = 1;

    virtual ~NowPlayingService() = default;

    virtual Origin localOrigin() const { return Origin::local; }

    /// The application on whose behalf is published; none clears it.
    virtual void setParentApplication(Origin origin,
                                      const std::optional<std::string>& applicationIdentifier) = 0;
    virtual void setNowPlayingInfo(Origin origin, const NowPlayingInfo& info, int mergePolicy) = 0;
};

} // namespace tarn
