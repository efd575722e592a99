#include "service/LinuxMediaEngine.h"

#include <malloc.h>

namespace tarn {

LinuxMediaEngine::LinuxMediaEngine(LinuxSound& sound, NotificationCenter& notifications, FileAccess& access,
                                   InterruptionListener& session)
    : LinuxMediaParts(sound, session),
      PlaybackEngine(LinuxMediaParts::loop, LinuxMediaParts::renderings, LinuxMediaParts::outputs,
                     notifications),
      opener_(access, porter, examiner),
      use_(LinuxMediaParts::loop, [this] { giveBack(); }) {}

LinuxMediaEngine::~LinuxMediaEngine() { LinuxMediaParts::loop.stop(); }

MediaAssetOutcome LinuxMediaEngine::openAsset(const std::string& URL) {
    MediaAssetOutcome outcome = opener_.open(URL);
    if (outcome.asset)
        outcome.asset = use_.counted(std::move(outcome.asset));
    return outcome;
}

/// Nobody has a use for media: what reads it goes, and the memory that is free goes back to the system. The
/// allocator would keep all that a client's twenty thousand tracks took.
void LinuxMediaEngine::giveBack() {
    examiner.clear();
    porter.clear();
    process.renew();
    malloc_trim(0);
}

} // namespace tarn
