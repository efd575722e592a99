// The service with nothing in the place of its media controls: what it costs without them.

#include "platform/ApplicationRegistry.h"
#include "platform/Localization.h"
#include "platform/NowPlayingService.h"
#include "platform/core/LocalNotificationCenter.h"
#include "platform/core/RemoteTargets.h"
#include "platform/core/SteadyClock.h"
#include "platform/core/WorkerQueues.h"
#include "platform/core/localization/DirectoryLocalization.h"
#include "platform/linux/Process.h"
#include "platform/linux/ipc/SocketListeners.h"
#include "platform/linux/ipc/TokenTable.h"
#include "platform/linux/log/SystemSink.h"
#include "platform/linux/media/LinuxAudioSession.h"
#include "platform/linux/media/LinuxMediaEngine.h"
#include "service/LongFormAudioServer.h"

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
    SocketListeners listeners{tokens};
    LinuxAudioSession audioSession{notifications};
    LinuxMediaEngine media{notifications, tokens, audioSession};
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
