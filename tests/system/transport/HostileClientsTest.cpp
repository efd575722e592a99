#include <gtest/gtest.h>

#include <sys/stat.h>
#include <sys/wait.h>

#include <random>

#include "tests/system/transport/ServiceUnderTest.h"

namespace tarn {
namespace {

using client::Client;

TEST(HostileClients, GarbageCostsItsSenderOnly) {
    ServiceUnderTest service;
    Client good(service.options());
    std::mt19937 random(7); // NOLINT(cert-msc51-cpp,cert-msc32-c): the same garbage every time
    for (int i = 0; i < 50; ++i) {
        const auto bad = service.connectRaw();
        Data garbage(1 + random() % 4'096);
        for (auto& byte : garbage)
            byte = static_cast<std::uint8_t>(random());
        bad.sendBytes(garbage);
    }
    EXPECT_TRUE(service.logs("ended the connection of client"));
    good.reconnect();
    EXPECT_TRUE(isServed(good, service.song()));
}

TEST(HostileClients, SomebodyElseIsRefused) {
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root can become somebody else";
    ServiceUnderTest service;
    const auto path = service.socketPath();
    // Even when the file lets them: the service looks at who it is.
    ASSERT_EQ(::chmod(path.c_str(), 0666), 0);
    ASSERT_EQ(::chmod(service.folder().path().c_str(), 0755), 0);
    const pid_t child = ::fork();
    if (child == 0) {
        if (::setuid(65'534) != 0)
            _exit(2);
        RawClient stranger(path);
        _exit(stranger.isCutOff() ? 0 : 1);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    EXPECT_EQ(status, 0);
    EXPECT_TRUE(service.logs("it belongs to another user"));
}

} // namespace
} // namespace tarn
