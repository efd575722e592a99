// How long it takes to the first frames of an item, and behind a seek, when a process of its own renders
// them, beside the same work in this process. And how long when the program that does it has to be started
// first.

#include <fcntl.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <semaphore>

#include "decoder/FfmpegLimits.h"
#include "decoder/FileDecoder.h"
#include "media/AssetOpener.h"
#include "media/ChildRenderingFactory.h"
#include "media/LinuxMediaAsset.h"
#include "mediaprocess/FileReader.h"
#include "rendering/ItemRendering.h"
#include "tests/support/AudioFixture.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

constexpr int rounds = 60;
constexpr std::size_t firstFrames = 44100 / 8;
constexpr PcmFormat format{SampleFormat::s16, 44100, 2};

/// Times in milliseconds.
class Times {
public:
    void add(Clock::time_point begin) {
        times_.push_back(std::chrono::duration<double, std::milli>(Clock::now() - begin).count());
    }
    double at(double share) {
        std::ranges::sort(times_);
        return times_[static_cast<std::size_t>(share * static_cast<double>(times_.size() - 1))];
    }

private:
    std::vector<double> times_;
};

struct Row {
    Times first;
    Times seek;
};

class NoFileAccess final : public FileAccess {
    SharedFile open(const std::string&) override { return nullptr; }
};

/// Asks the service's side of the media process, on a player thread.
class Service {
public:
    std::shared_ptr<LinuxMediaAsset> openFile(const std::filesystem::path& path) {
        auto asset = std::dynamic_pointer_cast<LinuxMediaAsset>(
            AssetOpener(access_, porter_, examiner_).open(fileURL(path)).asset);
        if (!asset)
            std::abort();
        return asset;
    }

    void measure(const std::filesystem::path& path, Row& row) {
        const auto asset = openFile(path);
        auto begin = Clock::now();
        onLoop([&] {
            rendering_ = factory_.open(asset, [this] { more_.release(); }).rendering;
            rendering_->seek(0s, 1, format);
        });
        renderFirst();
        row.first.add(begin);
        begin = Clock::now();
        onLoop([&] { rendering_->seek(90s, 1, format); });
        renderFirst();
        row.seek.add(begin);
        onLoop([&] { rendering_.reset(); });
    }

    void startAnew() {
        porter_.clear();
        examiner_.clear();
        process_.renew();
    }

private:
    void onLoop(const std::function<void()>& work) {
        std::binary_semaphore done(0);
        loop_.post([&] {
            work();
            done.release();
        });
        done.acquire();
    }

    void renderFirst() {
        PcmBuffer buffer;
        while (buffer.frames < firstFrames) {
            RenderedSpan span;
            onLoop([&] { span = rendering_->render(buffer, firstFrames - buffer.frames); });
            if (span.state == RenderedSpan::State::failed)
                std::abort();
            if (span.state == RenderedSpan::State::waiting)
                more_.acquire();
        }
    }

    NoFileAccess access_;
    MediaProcess process_;
    FilePorter porter_{process_};
    FileExaminer examiner_{process_, porter_};
    EventLoopThread loop_;
    ChildRenderingFactory factory_{loop_, process_, porter_};
    std::counting_semaphore<> more_{0};
    std::unique_ptr<Rendering> rendering_;
};

/// The same work here.
void measureHere(const std::filesystem::path& path, const AudioFileInfo& info, Row& row) {
    auto begin = Clock::now();
    FileReader reader({FileDescriptor(::open(path.c_str(), O_RDONLY | O_CLOEXEC))});
    FileDecoder decoder(reader, info);
    if (decoder.open())
        std::abort();
    ItemRendering rendering(decoder, info);
    const auto renderFrom = [&](std::chrono::nanoseconds position, Times& times) {
        rendering.seek(position, 1, format);
        PcmBuffer buffer;
        while (buffer.frames < firstFrames)
            rendering.render(buffer, firstFrames - buffer.frames);
        times.add(begin);
    };
    renderFrom(0s, row.first);
    begin = Clock::now();
    renderFrom(90s, row.seek);
}

int run() {
    const TemporaryFolder folder;
    writeWav(folder / "a.wav", makeSweep(180 * 44100, 44100, 2));
    const std::pair<const char*, const char*> files[] = {{"a.wav", nullptr},
                                                         {"a.flac", ""},
                                                         {"a.mp3", "-b:a 192k"},
                                                         {"a.m4a", "-c:a aac -b:a 192k"},
                                                         {"a.opus", "-c:a libopus -b:a 128k"},
                                                         {"a.ogg", "-c:a libvorbis -q:a 5"}};
    std::printf("ms, p50 / p95      first frames      here              seek              here\n");
    Service service;
    double worstFirst = 0;
    double worstSeek = 0;
    for (const auto& [name, encoding] : files) {
        if (encoding != nullptr)
            encodeAudio(folder / "a.wav", encoding, folder / name);
        const AudioFileInfo info = service.openFile(folder / name)->info();
        Row there;
        Row here;
        for (int round = 0; round < rounds; ++round) {
            service.measure(folder / name, there);
            measureHere(folder / name, info, here);
        }
        std::printf("%-12s", name);
        for (Times* times : {&there.first, &here.first, &there.seek, &here.seek})
            std::printf("  %7.2f /%7.2f", times->at(0.5), times->at(0.95));
        std::printf("\n");
        worstFirst = std::max(worstFirst, there.first.at(0.95));
        worstSeek = std::max(worstSeek, there.seek.at(0.5) - here.seek.at(0.5));
    }
    Row cold;
    for (int round = 0; round < rounds; ++round) {
        service.startAnew();
        const auto begin = Clock::now();
        Row one;
        service.measure(folder / "a.flac", one);
        cold.first.add(begin);
    }
    const auto tell = [](const char* what, double value, double goal) {
        std::printf("%-50s %7.2f ms   [goal: %g] %s\n", what, value, goal, value <= goal ? "" : "MISSED");
    };
    tell("first frames, parent up, worst format, p95", worstFirst, 8);
    tell("seek beyond the same work here, worst format, p50", worstSeek, 2);
    tell("first file of all, examined, opened and sought, p95", cold.first.at(0.95), 45);
    return 0;
}

} // namespace
} // namespace tarn

int main() {
    tarn::setFfmpegLimits();
    return tarn::run();
}
