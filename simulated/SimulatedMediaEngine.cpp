#include "simulated/SimulatedMediaEngine.h"

#include <memory>
#include <utility>

#include "simulated/SimulatedMediaAsset.h"

namespace tarn {

SimulatedMediaEngine::SimulatedMediaEngine(EventLoop& loop, NotificationCenter& notifications,
                                           SimulatedSandboxExtension& sandboxExtensions)
    : PlaybackEngine(loop, renderings_, speaker_, notifications), // they are only remembered there
      sandboxExtensions_(sandboxExtensions),
      renderings_(loop),
      speaker_(loop) {}

void SimulatedMediaEngine::addFile(const std::string& URL, MediaScript script) {
    auto shared = std::make_shared<const MediaScript>(std::move(script));
    files_.withLocked([&](auto& files) { files.insert_or_assign(URL, shared); });
}

MediaAssetOutcome SimulatedMediaEngine::openAsset(const std::string& URL) {
    auto script = files_.withLocked([&](const auto& files) -> std::shared_ptr<const MediaScript> {
        auto found = files.find(URL);
        return found == files.end() ? nullptr : found->second;
    });
    auto refuse = [](std::int64_t code, const char* why) {
        return MediaAssetOutcome{nullptr, {"SimulatedMedia", code, {{localizedDescriptionKey, why}}}};
    };
    if (!script)
        return refuse(2, "There is no such file.");
    if (script->token && !sandboxExtensions_.holds(*script->token))
        return refuse(13, "The file may not be read.");
    return {std::make_shared<SimulatedMediaAsset>(URL, std::move(script)), {}};
}

} // namespace tarn
