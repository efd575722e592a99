#pragma once

#include "media/AssetOpener.h"
#include "media/ChildRenderingFactory.h"
#include "media/ClientFiles.h"
#include "media/MediaUse.h"
#include "player/PlaybackEngine.h"
#include "sound/SystemOutput.h"
#include "system/FileAccess.h"

namespace tarn {

/// The player thread, and the sound server that it speaks to. Outlives the engine that plays with them.
struct LinuxSound {
    EventLoopThread loop;
    SoundServer server{loop};
};

/// What the engine of this machine is made of; the engine's base keeps references to it.
struct LinuxMediaParts {
    LinuxMediaParts(LinuxSound& sound, InterruptionListener& interruptions)
        : loop(sound.loop), outputs(loop, sound.server, interruptions) {}

    EventLoopThread& loop;
    MediaProcess process;
    FilePorter porter{process};
    FileExaminer examiner{process, porter};
    ChildRenderingFactory renderings{loop, process, porter};
    ClientFiles files{porter, loop};
    SystemOutputFactory outputs;
};

/// The media engine of this machine: processes of their own read, the sound server plays.
class LinuxMediaEngine final : private LinuxMediaParts, public PlaybackEngine {
public:
    /// All of these outlive the engine.
    LinuxMediaEngine(LinuxSound& sound, NotificationCenter& notifications, FileAccess& access,
                     InterruptionListener& session);

    /// Ends the player thread and silences what still plays.
    ~LinuxMediaEngine() override;

    /// Receives what clients hand over.
    FileReceiver& clientFiles() { return LinuxMediaParts::files; }

    MediaAssetOutcome openAsset(const std::string& URL) override;

private:
    void giveBack();

    const AssetOpener opener_;
    MediaUse use_;
};

} // namespace tarn
