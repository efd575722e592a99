#include <numbers>
#include <thread>

#include "sound/SoundError.h"
#include "tests/support/CapturedLog.h"
#include "tests/system/sound/SoundFixture.h"

namespace tarn {
namespace {

constexpr std::size_t second = 44'100; // in frames of the sink

/// What the recorder may be behind when an end is told: on a busy machine it comes late to what it records.
constexpr std::size_t recordersDelay = second;

TEST_F(SoundTest, PlaysAFileBitForBitToItsLastSample) {
    const Recording recording = makeSweep(130'001, 44100, 2);
    const auto player = makePlayer({makeItem(recording, "a.flac", "-c:a flac")});
    const Recorder recorder;
    player->setRate(1);
    ASSERT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    recorder.waitFrames(recordersDelay);
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
    recorder.waitFrames(recordersDelay);
    EXPECT_TRUE(find(whole.samples, recorder.samples()));
}

/// How far the position that a player tells is from what the recorder hears at the same moment, in seconds.
/// `recording` begins at frame 0 of its item, which plays at rate 1.
double positionError(const MediaQueuePlayer& player, const Recorder& recorder, const Recording& recording) {
    constexpr std::size_t window = 400;
    recorder.waitFrames(1);
    const double told = player.currentTime().seconds();
    const std::vector<std::int16_t> recorded = recorder.samples();
    const std::vector<std::int16_t> last(recorded.end() - 2 * window, recorded.end());
    const auto found =
        std::search(recording.samples.begin(), recording.samples.end(), last.begin(), last.end());
    if (found == recording.samples.end())
        return 1'000;
    const auto heard = static_cast<double>(found - recording.samples.begin()) / 2 + window;
    return told - heard / recording.rate;
}

TEST_F(SoundTest, TellsThePositionThatIsHeard) {
    const Recording recording =
        makeSweep(10 * second, 44100, 2); // a busy machine comes late to the last looks
    const auto player = makePlayer({makeItem(recording)});
    const Recorder recorder;
    player->setRate(1);
    recorder.waitFrames(22'050);
    double before = 0;
    for (int i = 0; i < 25; ++i) {
        recorder.waitFrames(4'410);
        const double now = player->currentTime().seconds();
        EXPECT_GT(now, before);
        before = now;
        // The recorder itself is behind by up to a block of the sink, 50 ms, and its own fragment.
        const double error = positionError(*player, recorder, recording);
        EXPECT_GT(error, -0.02);
        EXPECT_LT(error, 0.08);
    }
}

// This device takes two seconds at a time, and begins with ours only when those that it has are over.
TEST_F(SoundTest, AnItemShorterThanTheDevicesBufferMovesAndEndsWhenItIsHeard) {
    server.control({"load-module", "module-null-sink", "sink_name=slow"});
    server.control({"set-default-sink", "slow"});
    const Recording recording = makeSweep(second / 2, 44100, 2);
    for (int i = 0; i < 3; ++i) {
        const auto item = makeItem(recording);
        const auto player = makePlayer({item});
        player->setRate(1);
        double position = 0;
        while (player->rate() != 0 && (position = item->currentTime().seconds()) == 0)
            std::this_thread::yield();
        const auto beginning = std::chrono::steady_clock::now() - std::chrono::duration<double>(position);
        EXPECT_LT(position, 0.25) << "it is told from the beginning on";
        ASSERT_TRUE(events.wait(MediaItem::didPlayToEndTime));
        const std::chrono::duration<double> length = std::chrono::steady_clock::now() - beginning;
        EXPECT_GT(length.count(), 0.49);
        EXPECT_LT(length.count(), 0.7);
        registrations.clear(); // the next item may be where this one was
    }
}

TEST_F(SoundTest, PausesAndGoesOnWithoutLosingASample) {
    const Recording recording = makeSweep(4 * second, 44100, 2);
    const auto player = makePlayer({makeItem(recording)});
    const Recorder recorder;
    player->setRate(1);
    recorder.waitFrames(44'100);
    player->pause();
    const double paused = player->currentTime().seconds();
    recorder.waitFrames(22'050);
    EXPECT_EQ(player->currentTime().seconds(), paused);
    const auto silent = recorder.samples();
    EXPECT_TRUE(
        std::all_of(silent.end() - 17'640, silent.end(), [](std::int16_t sample) { return sample == 0; }));
    player->play();
    ASSERT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    recorder.waitFrames(recordersDelay);

    std::vector<std::int16_t> heard;
    const auto all = recorder.samples();
    std::copy_if(all.begin(), all.end(), std::back_inserter(heard),
                 [](std::int16_t sample) { return sample != 0; });
    std::vector<std::int16_t> expected;
    std::copy_if(recording.samples.begin(), recording.samples.end(), std::back_inserter(expected),
                 [](std::int16_t sample) { return sample != 0; });
    EXPECT_EQ(heard.size(), expected.size());
    EXPECT_TRUE(heard == expected);
}

TEST_F(SoundTest, SeeksToTheSampleWhilePlaying) {
    const Recording recording = makeSweep(8 * second, 44100, 2);
    const auto item = makeItem(recording, "a.flac");
    const auto player = makePlayer({item});
    const Recorder recorder;
    player->setRate(1);
    for (const double target : {5.5, 1.25, 7.0}) {
        recorder.waitFrames(30'000);
        item->seekToTime(MediaTime::fromSeconds(target, 44100));
        recorder.waitFrames(30'000);
        const auto frame = static_cast<std::size_t>(target * 44100);
        // A few milliseconds are blended with what was heard before.
        EXPECT_TRUE(find(recording.part(frame + 300, frame + 10'000).samples, recorder.samples())) << target;
    }
}

TEST_F(SoundTest, GoesOnInSilenceWithoutAServerAndSoundsAgainWhereItIs) {
    CapturedLog log;
    const Recording recording = makeSweep(12 * second, 44100, 2);
    const auto player = makePlayer({makeItem(recording)});
    {
        const Recorder recorder;
        player->setRate(1);
        recorder.waitFrames(44'100);
    }
    const double before = player->currentTime().seconds();
    server.kill();
    ASSERT_TRUE(log.waitFor("No sound server"));
    const auto killed = std::chrono::steady_clock::now();
    while (player->currentTime().seconds() < before + 1)
        ASSERT_LT(std::chrono::steady_clock::now() - killed, 5s) << "time stands still";
    server.start();
    ASSERT_TRUE(log.waitFor("The sound server is back", 2s));
    const Recorder recorder;
    recorder.waitFrames(44'100);
    const double elapsed = std::chrono::duration<double>(std::chrono::steady_clock::now() - killed).count();
    EXPECT_NEAR(player->currentTime().seconds(), before + elapsed, 0.7);
    EXPECT_NEAR(positionError(*player, recorder, recording), 0.03, 0.05);
    EXPECT_EQ(player->rate(), 1);
    EXPECT_EQ(log.errors().size(), 1u);
}

TEST_F(SoundTest, StepsAsideForACallAndComesBack) {
    const auto item = makeItem(makeSweep(20 * second, 44100, 2));
    const auto other = makeItem(makeSweep(20 * second, 44100, 2), "b.wav");
    const auto playing = makePlayer({item});
    const auto paused = makePlayer({other});
    registrations.push_back(notifications.addObserver(
        AudioSession::interruptionNotification, static_cast<AudioSession*>(&session),
        [this](const Notification& notification) {
            const bool ended =
                notification.info.at(AudioSession::interruptionTypeKey) == AudioSession::interruptionEnded;
            const bool resume = notification.info.contains(AudioSession::interruptionOptionsKey);
            events.add(ended ? (resume ? "ended, resume" : "ended") : "began");
        }));
    const Recorder recorder;
    paused->setRate(1);
    playing->setRate(1);
    recorder.waitFrames(22'050);
    paused->pause();
    recorder.waitFrames(22'050);
    for (int call = 0; call < 2; ++call) {
        {
            ChildProcess phone({"pacat", "--property=media.role=phone", "--raw", "--device=out", "/dev/zero"},
                               server.environment());
            ASSERT_TRUE(events.wait("began"));
            recorder.waitFrames(8'820);
            EXPECT_EQ(playing->rate(), 0);
        }
        ASSERT_TRUE(events.wait("ended, resume"));
        playing->play();
        recorder.waitFrames(8'820);
        EXPECT_EQ(playing->rate(), 1);
        EXPECT_EQ(paused->rate(), 0);
    }
}

TEST_F(SoundTest, PausesWhenItsDeviceGoesAndGoesOnWhenItIsMoved) {
    CapturedLog log;
    const auto player = makePlayer({makeItem(makeSweep(20 * second, 44100, 2))});
    const auto rate =
        player->observe(MediaQueuePlayer::rateKeyPath, [this](Observable&, const ChangeDescription& change) {
            events.add("rate " + std::to_string(static_cast<int>(std::get<float>(change.at("new")))));
        });
    const Recorder recorder;
    player->setRate(1);
    recorder.waitFrames(22'050);
    std::string input = server.control({"list", "short", "sink-inputs"});
    input = input.substr(0, input.find('\t'));
    server.control({"move-sink-input", input, "other"});
    recorder.waitFrames(22'050);
    EXPECT_EQ(player->rate(), 1);

    const std::string modules = server.control({"list", "short", "modules"});
    const std::size_t name = modules.find("sink_name=other");
    const std::size_t line = modules.rfind('\n', name) + 1;
    server.control({"unload-module", modules.substr(line, modules.find('\t', line) - line)});
    ASSERT_TRUE(events.wait("rate 0", 5s));
    EXPECT_TRUE(log.waitFor("the device that played is gone"));
    const double stopped = player->currentTime().seconds();
    recorder.waitFrames(8'820);
    EXPECT_EQ(player->currentTime().seconds(), stopped);
    ASSERT_TRUE(player->error());
    EXPECT_EQ(player->error()->code, static_cast<std::int64_t>(SoundErrorCode::deviceGone));
    player->setRate(1);
    recorder.waitFrames(22'050);
    EXPECT_NEAR(player->currentTime().seconds(), stopped + 0.5, 0.2) << "on the device that is left";
}

TEST_F(SoundTest, AChangeOfRateDropsNothingAndMakesNoClick) {
    Recording tone{44100, 2, {}};
    for (int i = 0; i < 352'800; ++i)
        for (int channel = 0; channel < 2; ++channel)
            tone.samples.push_back(
                static_cast<std::int16_t>(8'000 * std::sin(2 * std::numbers::pi * 220 * i / 44'100)));
    const auto player = makePlayer({makeItem(tone)});
    const Recorder recorder;
    player->setRate(1);
    for (const float rate : {1.5F, 2.0F, 0.5F, 1.0F}) {
        recorder.waitFrames(22'050);
        const double before = player->currentTime().seconds();
        player->setRate(rate);
        EXPECT_NEAR(player->currentTime().seconds(), before, 0.02);
    }
    ASSERT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    recorder.waitFrames(recordersDelay);
    const auto samples = recorder.samples();
    std::size_t first = 0;
    while (samples[first] == 0)
        ++first;
    const std::size_t frames = soundingFrames(samples);
    int steepest = 0;
    for (std::size_t i = first; i + 4 < first + 2 * frames; i += 2)
        steepest = std::max(steepest, std::abs(samples[i + 2] - samples[i]));
    EXPECT_LT(steepest, 600) << "the tone itself rises by at most 251 from frame to frame";
}

TEST_F(SoundTest, AChangeOfFormatBetweenItemsLeavesNoGap) {
    const auto player = makePlayer({makeItem(makeSweep(44'100, 44100, 2), "1.wav"),
                                    makeItem(makeSweep(48'000, 48000, 1), "2.wav"),
                                    makeItem(makeSweep(22'050, 22050, 2), "3.wav")});
    const Recorder recorder;
    player->setRate(1);
    for (int i = 0; i < 3; ++i)
        ASSERT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    recorder.waitFrames(recordersDelay);
    EXPECT_NEAR(static_cast<double>(soundingFrames(recorder.samples())), 132'300, 20);
}

struct LossyJoin : SoundTest, testing::WithParamInterface<std::pair<const char*, const char*>> {};

TEST_P(LossyJoin, LeavesNoGap) {
    const Recording whole = makeSweep(4 * second, 44100, 2);
    const auto [extension, arguments] = GetParam();
    const auto player =
        makePlayer({makeItem(whole.part(0, 77'777), std::string("1.") + extension, arguments),
                    makeItem(whole.part(77'777, whole.frames()), std::string("2.") + extension, arguments)});
    const Recorder recorder;
    player->setRate(1);
    for (int i = 0; i < 2; ++i)
        ASSERT_TRUE(events.wait(MediaItem::didPlayToEndTime));
    recorder.waitFrames(recordersDelay);
    const auto samples = recorder.samples();
    const std::vector<float> heard = toFloats({44100, 2, samples});
    const std::vector<float> original = toFloats(whole);
    const auto piece = [&](std::size_t frame) {
        return std::vector<float>(original.begin() + static_cast<std::ptrdiff_t>(2 * frame),
                                  original.begin() + static_cast<std::ptrdiff_t>(2 * (frame + 4'000)));
    };
    // Where the first half is, the second must be: 77,777 frames further, to the frame.
    std::int64_t start = 0;
    while (samples[static_cast<std::size_t>(2 * start)] == 0)
        ++start;
    const std::int64_t first = start + 40'000 + displacement(piece(40'000), heard, start + 40'000, 2, 1'500);
    // Opus has 48,000 frames a second, the sink 44,100: each half ends between two of its frames.
    const std::int64_t rounding = extension == std::string("opus") ? 1 : 0;
    EXPECT_LE(std::abs(displacement(piece(120'000), heard, first + 80'000, 2, 1'500)), rounding);
}

INSTANTIATE_TEST_SUITE_P(Formats, LossyJoin,
                         testing::Values(std::pair("mp3", "-c:a libmp3lame -q:a 2"),
                                         std::pair("m4a", "-c:a aac -b:a 256k"),
                                         std::pair("ogg", "-c:a libvorbis -q:a 7"),
                                         std::pair("opus", "-c:a libopus -b:a 192k")),
                         [](const auto& information) { return std::string(information.param.first); });

} // namespace
} // namespace tarn
