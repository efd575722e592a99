#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fcntl.h>
#include <linux/close_range.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <future>
#include <random>
#include <thread>

#include "tests/system/transport/ServiceUnderTest.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;
using client::Client;
using testing::HasSubstr;

TEST(TheProcess, EndsCleanlyOnEveryStopSignal) {
    ServiceUnderTest service;
    for (const int signal : {SIGTERM, SIGINT, SIGHUP}) {
        Client client(service.options());
        EXPECT_EQ(service.stop(signal), 0);
        EXPECT_FALSE(std::filesystem::exists(service.socketPath()));
        service.start();
    }
}

TEST(TheProcess, EndsWithinASecondWhateverItIsDoing) {
    ServiceUnderTest service;
    const auto song = service.song();
    std::mt19937 random(11); // NOLINT(cert-msc51-cpp,cert-msc32-c): the same moments every time
    for (int i = 0; i < 20; ++i) {
        Client client(service.options());
        std::jthread worker([&](const std::stop_token& stop) {
            while (!stop.stop_requested() && isServed(client, song)) {
                client.upsertQueuePlayer("player", {"item"});
                client.setRate("player", 1);
            }
        });
        // Not waiting for anything: any moment is a good one for a signal.
        std::promise<void>().get_future().wait_for(std::chrono::microseconds(random() % 20'000));
        const auto begin = std::chrono::steady_clock::now();
        EXPECT_EQ(service.stop(), 0);
        EXPECT_LT(std::chrono::steady_clock::now() - begin, 1s);
        worker.request_stop();
        worker.join();
        service.start();
    }
}

TEST(TheProcess, LeavesOneThatServesAlone) {
    ServiceUnderTest service;
    const auto second =
        runCommand({TARND}, {"XDG_RUNTIME_DIR=" + service.folder().path().string(), "JOURNAL_STREAM="});
    EXPECT_EQ(second.status, 1);
    EXPECT_THAT(second.output, HasSubstr("is served by another process"));
    Client client(service.options());
    EXPECT_TRUE(isServed(client, service.song()));
}

TEST(TheProcess, TakesOnlyTwoOptions) {
    EXPECT_EQ(runCommand({TARND, "--version"}).status, 0) << "or what decodes media is not there";
    EXPECT_THAT(runCommand({TARND, "--help"}).output, HasSubstr("Usage: tarnd"));
    EXPECT_EQ(runCommand({TARND, "--verbose"}).status, 2);
}

TEST(TheProcess, LoadsNoMediaLibraryAndTheSoundServersOnlyWhenItIsNeeded) {
    ServiceUnderTest service;
    const auto loaded = [&](const char* library) {
        std::ifstream maps("/proc/" + std::to_string(service.process().pid()) + "/maps");
        const std::string text{std::istreambuf_iterator<char>(maps), {}};
        return text.find(library) != std::string::npos;
    };
    Client client(service.options());
    ASSERT_TRUE(isServed(client, service.song()));
    EXPECT_TRUE(loaded("libsystemd"));
    EXPECT_FALSE(loaded("libav") || loaded("libsw") || loaded("libsonic"));
    EXPECT_FALSE(loaded("libpulse")) << "nothing is to play yet";
}

TEST(TheProcess, LeavesNoFileToAProgramThatItMightStart) {
    // What this test was given by who started it is not the service's.
    ASSERT_EQ(::close_range(STDERR_FILENO + 1, ~0U, CLOSE_RANGE_CLOEXEC), 0);
    ServiceUnderTest service;
    Client client(service.options());
    ASSERT_EQ(client.destroyAsset("none").get().outcome, client::Outcome::released);
    const std::filesystem::path folder = "/proc/" + std::to_string(service.process().pid());
    for (const auto& entry : std::filesystem::directory_iterator(folder / "fdinfo")) {
        const auto number = std::stoi(entry.path().filename().string());
        if (number <= STDERR_FILENO)
            continue;
        const auto information = runCommand({"cat", entry.path().string()}).output;
        const auto flags = std::stoul(information.substr(information.find("flags:") + 6), nullptr, 8);
        EXPECT_NE(flags & O_CLOEXEC, 0U)
            << std::filesystem::read_symlink(folder / "fd" / entry.path().filename());
    }
}

} // namespace
} // namespace tarn
