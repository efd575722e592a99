#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "roles/NowPlayingService.h"
#include "roles/RemoteCommandCenter.h"

namespace tarn {

/// The media controls of the desktop or watch: a media player on the session bus (MPRIS), which shows what is
/// published and what is done with it, and passes commands on to the queue players. It also keeps a playing
/// device from idle sleep and pauses before any other sleep.
///
/// Any thread may call. The player is on the bus as long as a queue player lives. Everything goes on without
/// a bus; it comes back with it. Two threads: "bus" and "remote commands".
class LinuxMediaControls final : public NowPlayingService {
public:
    /// The name of an installed application for a person, by the name of its desktop entry; none when there
    /// is no such entry. Called on the threads that publish.
    using ApplicationName = std::function<std::optional<std::string>(const std::string& desktopEntry)>;

    struct Addresses {
        std::string sessionBus;
        std::string systemBus;

        /// As the environment says.
        static Addresses fromEnvironment();
    };

    explicit LinuxMediaControls(ApplicationName applicationName,
                                Addresses addresses = Addresses::fromEnvironment());

    /// Waits for a command that is being delivered. The player leaves the bus.
    ~LinuxMediaControls() override;

    RemoteCommandCenter& remoteCommands();

    void setParentApplication(Origin origin,
                              const std::optional<std::string>& applicationIdentifier) override;
    void setNowPlayingInfo(Origin origin, const NowPlayingInfo& info, int mergePolicy) override;

private:
    class Implementation;

    std::unique_ptr<Implementation> implementation_;
};

} // namespace tarn
