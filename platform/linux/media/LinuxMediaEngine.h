#pragma once

#include "platform/core/media/CoreMediaEngine.h"
#include "platform/linux/FileAccess.h"
#include "platform/linux/media/AssetOpener.h"
#include "platform/linux/media/IdleHeap.h"
#include "platform/linux/media/LinuxAudioSession.h"
#include "platform/linux/media/LinuxRendering.h"
#include "platform/linux/media/SystemOutput.h"

namespace tarn {

/// What the engine of this machine is made of; the engine's base keeps references to it.
struct LinuxMediaParts {
    explicit LinuxMediaParts(InterruptionListener& interruptions) : outputs(loop, interruptions) {}

    DecoderLoader loader;
    LinuxPlayerLoop loop;
    LinuxRenderingFactory renderings{loop, loader};
    SystemOutputFactory outputs;
};

/// The media engine of this machine: FFmpeg reads, the sound server plays.
class LinuxMediaEngine final : private LinuxMediaParts, public CoreMediaEngine {
public:
    /// All of these outlive the engine.
    LinuxMediaEngine(NotificationCenter& notifications, FileAccess& files, LinuxAudioSession& session);

    /// Silences what still plays.
    ~LinuxMediaEngine() override;

    MediaAssetOutcome openAsset(const std::string& URL) override;

private:
    const AssetOpener opener_;
    IdleHeap heap_{LinuxMediaParts::loop};
};

} // namespace tarn
