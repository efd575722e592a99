// What a crash of the service costs who listens: it is killed while it plays to a sound server, started
// again, and libtarn puts back what played. The samples tell their place in the file, so what is recorded
// tells where the music broke off and where it went on.   usage: bench_reconnect [KILLS]

#include <sys/socket.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>
#include <vector>

#include <tarn/Client.h>

#include "ipc/SocketAddress.h"
#include "tests/support/AudioFixture.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryFolder.h"
#include "tests/system/sound/SoundServerProcess.h"

namespace tarn {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::uint32_t rate = 44'100;
constexpr char player[] = "player,org.example.Bench";

/// Frame i holds its number, and is never silent.
Recording countingFrames(std::size_t frames) {
    Recording file{rate, 2, {}};
    for (std::size_t i = 0; i < frames; ++i) {
        file.samples.push_back(static_cast<std::int16_t>(1 + i / 16'384));
        file.samples.push_back(static_cast<std::int16_t>(i % 16'384));
    }
    return file;
}

/// The place in the file, in milliseconds, that a recorded frame comes from; none for silence.
std::optional<double> placeOf(const std::vector<std::int16_t>& recorded, std::size_t frame) {
    const auto high = recorded[2 * frame];
    if (high <= 0)
        return std::nullopt;
    return ((high - 1) * 16'384.0 + recorded[2 * frame + 1]) / rate * 1'000;
}

class Service {
public:
    explicit Service(std::vector<std::string> environment) : environment_(std::move(environment)) {
        environment_.insert(environment_.begin(),
                            {"XDG_RUNTIME_DIR=" + folder_.path().string(),
                             "NOTIFY_SOCKET=" + (folder_ / "ready").string(),
                             "DBUS_SESSION_BUS_ADDRESS=unix:path=/nowhere", "JOURNAL_STREAM="});
        if (!SocketAddress((folder_ / "ready").string()).bind(ready_.get()))
            std::abort();
        start();
    }

    /// Returns when it is ready.
    void start() {
        process_.emplace(std::vector<std::string>{TARND}, environment_,
                         ChildProcess::ErrorOutput::withOutput);
        char message = 0;
        if (::recv(ready_.get(), &message, 1, 0) != 1)
            std::abort();
    }

    void kill() { process_.reset(); }

    std::string path(const char* name) const { return (folder_ / name).string(); }

private:
    TemporaryFolder folder_;
    FileDescriptor ready_{::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
    std::vector<std::string> environment_;
    std::optional<ChildProcess> process_;
};

void report(const char* what, std::vector<double> times) {
    std::ranges::sort(times);
    std::printf("%-58s median %7.1f ms   worst %7.1f ms\n", what, times[times.size() / 2], times.back());
}

int run(int kills) {
    const SoundServerProcess sound;
    Service service(sound.environment());
    writeWav(service.path("file.wav"), countingFrames(rate * std::size_t{1'000}));
    client::Client client(
        {.socketPath = service.path("ostrel.tarnd"), .reconnectLimit = std::chrono::seconds(20)});
    client.upsertAsset({.identifier = "a", .URL = client::fileURL(service.path("file.wav"))}).get();
    client.upsertItem("a", "a").get();
    client.upsertQueuePlayer(player, {"a"}).get();
    client.setRate(player, 1).get();

    std::vector<double> untilSound;
    std::vector<double> untilTold;
    std::vector<double> errors;
    for (int round = 0; round < kills; ++round) {
        const Recorder recorder;
        recorder.waitFrames(rate / 2 + static_cast<std::size_t>(round) * 701);
        service.kill();
        recorder.waitFrames(rate / 2); // all that was on its way has sounded
        auto frame = recorder.frames();
        const auto before = recorder.samples();
        auto last = before.size() / 2 - 1;
        while (!placeOf(before, last))
            --last;
        service.start();
        const auto back = Clock::now();
        const auto since = [&] {
            return std::chrono::duration<double, std::milli>(Clock::now() - back).count();
        };
        while (!std::holds_alternative<client::Reconnected>(client.nextEvent().value()))
            continue;
        untilTold.push_back(since());
        std::vector<std::int16_t> after;
        do {
            recorder.waitFrames(1);
            for (after = recorder.samples(); frame < after.size() / 2 && !placeOf(after, frame);)
                ++frame;
        } while (frame >= after.size() / 2);
        untilSound.push_back(since());
        errors.push_back(std::abs(*placeOf(after, frame) - *placeOf(before, last)));
    }
    std::printf("%d kills while playing\n", kills);
    report("service ready until the program is told", untilTold);
    report("service ready until sound is recorded", untilSound);
    report("last place heard to the first one heard again, apart", errors);
    return 0;
}

} // namespace
} // namespace tarn

int main(int argc, char** argv) { return tarn::run(argc > 1 ? std::atoi(argv[1]) : 50); }
