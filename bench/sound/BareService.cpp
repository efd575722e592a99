// The service with nothing in the place of its media controls: what it costs without them.

#include "controls/RemoteTargets.h"
#include "ipc/SocketListeners.h"
#include "ipc/TokenTable.h"
#include "localization/DirectoryLocalization.h"
#include "log/SystemSink.h"
#include "observation/LocalNotificationCenter.h"
#include "roles/ApplicationRegistry.h"
#include "roles/Localization.h"
#include "roles/NowPlayingService.h"
#include "service/LinuxMediaEngine.h"
#include "service/LongFormAudioServer.h"
#include "sound/LinuxAudioSession.h"
#include "system/Process.h"
#include "threads/SteadyClock.h"
#include "threads/WorkerQueues.h"

namespace tarn {
namespace {

class NoApplications final : public ApplicationRegistry {
    std::optional<std::string> applicationContainingExtension(const std::string&) override { return {}; }
};

class NoScreen final : public NowPlayingService {
    void setParentApplication(Origin, const std::optional<std::string>&) override {}
    void setNowPlayingInfo(Origin, const NowPlayingInfo&, int) override {}
};

struct BarePlatform {
    Platform roles() {
        return {.clock = clock,
                .queues = queues,
                .listeners = listeners,
                .localization = *localization,
                .notifications = notifications,
                .media = media,
                .audioSession = audioSession,
                .sandboxExtensions = tokens,
                .remoteCommands = remoteCommands,
                .nowPlaying = nowPlaying,
                .applications = applications};
    }

    SteadyClock clock;
    WorkerQueues queues;
    const std::unique_ptr<Localization> localization = systemLocalization();
    LocalNotificationCenter notifications;
    TokenTable tokens;
    LinuxSound sound;
    LinuxAudioSession audioSession{sound.loop, sound.server, notifications};
    LinuxMediaEngine media{sound, notifications, tokens, audioSession};
    SocketListeners listeners{tokens, media.clientFiles()};
    RemoteTargets remoteCommands;
    NoScreen nowPlaying;
    NoApplications applications;
};

} // namespace
} // namespace tarn

int main() {
    tarn::prepareSignals();
    tarn::raiseFileLimit();
    tarn::SystemLog::setSink(tarn::systemSink("tarnd"));
    static auto& platform = *new tarn::BarePlatform;
    tarn::endOnStopSignals([] { platform.listeners.removeSocketFiles(); });
    tarn::VLLongFormAudioServer::sharedLongFormAudioServer(platform.roles())->run();
}
