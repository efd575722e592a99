#pragma once

#include <map>
#include <memory>
#include <string>

#include "player/PlaybackEngine.h"
#include "simulated/MediaScript.h"
#include "simulated/SimulatedRendering.h"
#include "simulated/SimulatedSandboxExtension.h"
#include "simulated/SimulatedSpeaker.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// The engine's own queue logic over scripted files, arithmetic and the loop's time, which may be virtual.
///
/// Any thread may call.
class SimulatedMediaEngine final : public PlaybackEngine {
public:
    SimulatedMediaEngine(EventLoop& loop, NotificationCenter& notifications,
                         SimulatedSandboxExtension& sandboxExtensions);

    /// From now on there is such a file. `URL` may be any text.
    void addFile(const std::string& URL, MediaScript script = {});

    /// A URL without a file gives an error with the code 2.
    MediaAssetOutcome openAsset(const std::string& URL) override;

    /// Where the players sound.
    SimulatedSpeaker& speaker() { return speaker_; }

private:
    SimulatedSandboxExtension& sandboxExtensions_;
    MutexProtected<std::map<std::string, std::shared_ptr<const MediaScript>>> files_;
    SimulatedRenderingFactory renderings_;
    SimulatedSpeaker speaker_;
};

} // namespace tarn
