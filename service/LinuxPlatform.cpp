#include "service/LinuxPlatform.h"

#include "localization/DirectoryLocalization.h"

namespace tarn {

LinuxPlatform::LinuxPlatform()
    : localization(systemLocalization()),
      applications(systemApplicationRegistry(localization->preferredLanguages())),
      controls(
          [this](const std::string& application) { return applications->applicationName(application); }) {}

Platform LinuxPlatform::roles() {
    return {.clock = clock,
            .queues = queues,
            .listeners = listeners,
            .localization = *localization,
            .notifications = notifications,
            .media = media,
            .audioSession = audioSession,
            .sandboxExtensions = tokens,
            .remoteCommands = controls.remoteCommands(),
            .nowPlaying = controls,
            .applications = *applications};
}

} // namespace tarn
