#include "tests/service/World.h"

#include "roles/MediaEngine.h"
#include "service/AudioFilePlayerServer.h"
#include "threads/LiveObjects.h"

namespace tarn {

SimulatedWorld::SimulatedWorld(std::uint64_t seed)
    : platform_(seed), service_(std::make_shared<VLLongFormAudioServer>(platform_.roles())) {
    service_->run();
}

SimulatedWorld::~SimulatedWorld() { settle(); }

void SimulatedWorld::linger() {
    if (random(2) == 0)
        settle();
}

/// Knows no file.
class ThreadedWorld::NoMedia final : public MediaEngine {
public:
    MediaAssetOutcome openAsset(const std::string& URL) override {
        return {nullptr, {"test", 2, {{"URL", URL}}}};
    }
    std::shared_ptr<MediaItem> makeItem(std::shared_ptr<MediaAsset>) override { return nullptr; }
    std::shared_ptr<MediaQueuePlayer> makeQueuePlayer(std::vector<std::shared_ptr<MediaItem>>) override {
        return nullptr;
    }
};

/// Is never asked, for want of a player.
class ThreadedWorld::NoSession final : public AudioSession {
public:
    std::optional<Error> setCategory(Category, Mode, RouteSharingPolicy, std::uint64_t) override {
        return {};
    }
    void activateWithOptions(std::uint64_t, ActivationCompletion completion) override {
        completion(true, {});
    }
};

ThreadedWorld::ThreadedWorld(std::uint64_t seed)
    : random_(seed),
      media_(std::make_unique<NoMedia>()),
      audioSession_(std::make_unique<NoSession>()),
      threadsLeft_(2 + static_cast<int>(seed % 3)),
      queues_([this](auto body) { return threadsLeft_.fetch_sub(1) > 0 && startThread(std::move(body)); }),
      listeners_({IOThread_.create("I/O"), [this](std::size_t limit) { return random(limit); },
                  [] { std::this_thread::yield(); }}),
      service_(std::make_shared<VLLongFormAudioServer>(
          Platform{clock_, queues_, listeners_, localization_, notifications_, *media_, *audioSession_,
                   sandboxExtensions_, remoteCommands_, nowPlaying_, applications_})) {
    queues_.endMainLoop(); // the main thread only waits for the end: it is not needed
    service_->run();
}

void SimulatedWorld::settleIntake() {
    platform_.listeners.settle();
    platform_.queues.main().sync([] {});
}

ThreadedWorld::~ThreadedWorld() { settle(); }

void ThreadedWorld::linger() {
    for (auto times = random(20); times > 0; --times)
        std::this_thread::yield();
}

void ThreadedWorld::settleIntake() {
    listeners_.settle();
    queues_.main().sync([] {});
}

void ThreadedWorld::settle() {
    settleIntake();
    std::shared_ptr<VLTorviAudioFilePlayerServer> router;
    service_->commandServiceQueue()->sync([&] { router = service_->audioFilePlayerServer(); });
    if (router != nullptr) {
        router->playerItemManagerQueue()->sync([] {});
        router->queuePlayerManagerQueue()->sync([] {});
    }
    // Commands keep their router: those of the clients before have run when no other router is left.
    while (LiveObjects::counts()["router"] > (router != nullptr ? 1 : 0))
        std::this_thread::yield();
}

} // namespace tarn
