#include <condition_variable>
#include <deque>

#include "platform/core/LocalNotificationCenter.h"
#include "platform/linux/media/LinuxMediaEngine.h"
#include "tests/linux_media/MediaFixture.h"
#include "tests/support/CapturedLog.h"
#include "tests/system/sound/SoundServerProcess.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

/// Things that happen on other threads, to be waited for.
class Events {
public:
    void add(std::string event) {
        std::lock_guard lock(mutex_);
        events_.push_back(std::move(event));
        changed_.notify_all();
    }

    /// Waits for the next event of this name and forgets all before it.
    [[nodiscard]] bool wait(const std::string& event, std::chrono::milliseconds limit = 20s) {
        std::unique_lock lock(mutex_);
        const auto arrived = [&] {
            while (!events_.empty() && events_.front() != event)
                events_.pop_front();
            return !events_.empty();
        };
        if (!changed_.wait_for(lock, limit, arrived))
            return false;
        events_.pop_front();
        return true;
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<std::string> events_;
};

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

    SoundServerProcess server;
    TemporaryFolder folder;
    Events events;
    LocalNotificationCenter notifications;
    NoFileAccess access;
    LinuxAudioSession session{notifications};
    LinuxMediaEngine engine{notifications, access, session};
    std::vector<RegistrationHandle> registrations;
};

TEST_F(SoundTest, PlaysAFileBitForBitToItsLastSample) {
    const Recording recording = makeSweep(130'001, 44100, 2);
    const auto player = makePlayer({makeItem(recording, "a.flac", "-c:a flac")});
    const Recorder recorder;
    player->setRate(1);
    ASSERT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    recorder.waitFrames(8'820);
    EXPECT_TRUE(find(recording.samples, recorder.samples()));
    EXPECT_EQ(player->rate(), 0);
}

TEST_F(SoundTest, ItemsOfEveryLosslessFormatJoinWithoutAGap) {
    const Recording whole = makeSweep(300'000, 44100, 2);
    const auto player =
        makePlayer({makeItem(whole.part(0, 70'001), "1.wav"), makeItem(whole.part(70'001, 150'003), "2.flac"),
                    makeItem(whole.part(150'003, 151'000), "3.m4a", "-c:a alac"),
                    makeItem(whole.part(151'000, 300'000), "4.aiff")});
    const Recorder recorder;
    player->setRate(1);
    for (int i = 0; i < 4; ++i)
        ASSERT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    recorder.waitFrames(8'820);
    EXPECT_TRUE(find(whole.samples, recorder.samples()));
}

} // namespace
} // namespace tarn
