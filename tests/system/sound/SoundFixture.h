#pragma once

#include "observation/LocalNotificationCenter.h"
#include "service/LinuxMediaEngine.h"
#include "sound/LinuxAudioSession.h"
#include "tests/support/Events.h"
#include "tests/support/MediaFixture.h"
#include "tests/system/sound/SoundServerProcess.h"

namespace tarn {

using namespace std::chrono_literals;

struct SoundTest : testing::Test {
    std::shared_ptr<MediaItem> makeItem(const std::filesystem::path& path) {
        auto outcome = engine.openAsset(fileURL(path));
        EXPECT_NE(outcome.asset, nullptr) << path;
        auto item = engine.makeItem(outcome.asset);
        for (const char* name : {MediaItem::didPlayToEndTime, MediaItem::failedToPlayToEndTime})
            registrations.push_back(notifications.addObserver(
                name, item.get(), [this, name](const Notification&) { events.add(name); }));
        return item;
    }

    std::shared_ptr<MediaItem> makeItem(const Recording& recording, const std::string& name = "a.wav",
                                        const std::string& arguments = "") {
        writeWav(folder / "source.wav", recording);
        if (name.ends_with(".wav"))
            writeWav(folder / name, recording);
        else
            encodeAudio(folder / "source.wav", arguments, folder / name);
        return makeItem(folder / name);
    }

    std::shared_ptr<MediaQueuePlayer> makePlayer(std::vector<std::shared_ptr<MediaItem>> items) {
        auto player = engine.makeQueuePlayer(std::move(items));
        player->setAudioSession(session);
        return player;
    }

    /// Frame of `recorded` at which `part` begins, sample for sample; none when it is nowhere.
    static std::optional<std::size_t> find(const std::vector<std::int16_t>& part,
                                           const std::vector<std::int16_t>& recorded) {
        const auto found = std::search(recorded.begin(), recorded.end(), part.begin(), part.end());
        if (found == recorded.end())
            return std::nullopt;
        return static_cast<std::size_t>(found - recorded.begin()) / 2;
    }

    /// Frames from the first to the last that is not silent.
    static std::size_t soundingFrames(const std::vector<std::int16_t>& samples) {
        const auto sounds = [](std::int16_t sample) { return sample != 0; };
        const auto first = std::find_if(samples.begin(), samples.end(), sounds);
        const auto last = std::find_if(samples.rbegin(), samples.rend(), sounds).base();
        return first < last ? static_cast<std::size_t>(last - first + 1) / 2 : 0;
    }

    SoundServerProcess server{
        {"module-null-sink sink_name=other norewinds=1", "module-rescue-streams", "module-role-cork"}};
    TemporaryFolder folder;
    Events events;
    LocalNotificationCenter notifications;
    NoFileAccess access;
    LinuxSound sound;
    LinuxAudioSession session{sound.loop, sound.server, notifications};
    LinuxMediaEngine engine{sound, notifications, access, session};
    std::vector<RegistrationHandle> registrations;
};

} // namespace tarn
