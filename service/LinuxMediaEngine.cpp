#include "service/LinuxMediaEngine.h"

namespace tarn {

LinuxMediaEngine::LinuxMediaEngine(NotificationCenter& notifications, FileAccess& files,
                                   LinuxAudioSession& session)
    : LinuxMediaParts(session),
      PlaybackEngine(LinuxMediaParts::loop, LinuxMediaParts::renderings, LinuxMediaParts::outputs,
                     notifications),
      opener_(files, porter, examiner) {}

LinuxMediaEngine::~LinuxMediaEngine() { LinuxMediaParts::loop.stop(); }

MediaAssetOutcome LinuxMediaEngine::openAsset(const std::string& URL) {
    MediaAssetOutcome outcome = opener_.open(URL);
    if (outcome.asset)
        outcome.asset = heap_.counted(std::move(outcome.asset));
    return outcome;
}

} // namespace tarn
