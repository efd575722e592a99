#include "platform/linux/media/LinuxMediaEngine.h"

namespace tarn {

LinuxMediaEngine::LinuxMediaEngine(NotificationCenter& notifications, FileAccess& files,
                                   LinuxAudioSession& session)
    : LinuxMediaParts(session),
      CoreMediaEngine(LinuxMediaParts::loop, LinuxMediaParts::renderings, LinuxMediaParts::outputs,
                      notifications),
      opener_(files, loader) {}

LinuxMediaEngine::~LinuxMediaEngine() { LinuxMediaParts::loop.stop(); }

} // namespace tarn
