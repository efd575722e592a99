#include "tests/player/Listening.h"

#include <cstdio>
#include <utility>

#include "roles/MediaAsset.h"

namespace tarn {

Listening::Listening(std::uint64_t seed) : platform(seed) { platform.media.speaker().listen(); }

std::shared_ptr<MediaItem> Listening::item(const std::string& name, MediaScript script) {
    platform.media.addFile(name, std::move(script));
    auto item = platform.media.makeItem(platform.media.openAsset(name).asset);
    watch(item, name);
    return item;
}

std::shared_ptr<MediaItem> Listening::item(const std::string& name, std::chrono::nanoseconds duration) {
    MediaScript script;
    script.duration = duration;
    return item(name, std::move(script));
}

void Listening::watch(const std::shared_ptr<MediaItem>& item, const std::string& name) {
    registrations_.push_back(item->observe(MediaItem::statusKeyPath, [this, name](Observable& object, auto&) {
        auto status = static_cast<MediaItem&>(object).status();
        if (status != MediaStatus::unknown)
            note(name + (status == MediaStatus::failed ? " failed" : " ready"));
    }));
    auto follow = [&](const char* notification, const std::string& text) {
        registrations_.push_back(platform.notifications.addObserver(
            notification, item.get(), [this, line = name + text](const Notification&) { note(line); }));
    };
    follow(MediaItem::didPlayToEndTime, " played to its end");
    follow(MediaItem::failedToPlayToEndTime, " did not play to its end");
    follow(MediaItem::timeJumped, " jumped");
}

MediaQueuePlayer& Listening::play(std::vector<std::shared_ptr<MediaItem>> items, float rate) {
    player = platform.media.makeQueuePlayer(std::move(items));
    player->setAudioSession(platform.audioSession);
    settle();
    registrations_.push_back(
        player->observe(MediaQueuePlayer::currentItemKeyPath, [this](Observable&, auto& change) {
            note("current " + nameOf(std::get<std::shared_ptr<MediaItem>>(change.at("new"))));
        }));
    registrations_.push_back(player->observe(MediaQueuePlayer::rateKeyPath, [this](Observable&,
                                                                                   auto& change) {
        char text[32];
        std::snprintf(text, sizeof text, "rate %g", static_cast<double>(std::get<float>(change.at("new"))));
        note(text);
    }));
    registrations_.push_back(
        player->observe(MediaQueuePlayer::statusKeyPath, [this](Observable& object, auto&) {
            const auto error = static_cast<MediaQueuePlayer&>(object).error();
            note(error ? "sound error " + std::to_string(error->code) : "sound");
        }));
    reports_.clear();
    player->setRate(rate);
    settle();
    return *player;
}

std::string Listening::nameOf(const std::shared_ptr<MediaItem>& item) const {
    return item ? item->asset()->URL() : "none";
}

void Listening::note(const std::string& event) {
    char time[32];
    std::snprintf(time, sizeof time,
                  "%.3f: ", std::chrono::duration<double>(platform.scheduler.now()).count());
    reports_ += time + event + "\n";
}

std::string Listening::reports() {
    settle();
    return std::exchange(reports_, {});
}

std::string Listening::heard() {
    settle();
    std::string text;
    for (const auto& heard : platform.media.speaker().heard())
        text += heard.text() + "\n";
    return text;
}

} // namespace tarn
