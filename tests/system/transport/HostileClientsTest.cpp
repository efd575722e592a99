#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <random>
#include <thread>

#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"
#include "tests/ipc/WatchedFile.h"
#include "tests/system/transport/ServiceUnderTest.h"

namespace tarn {
namespace {

using client::Client;

Data positionQuery(std::uint64_t callId) {
    auto item = std::make_shared<VLProtoObjectMessage>();
    item->setIdentifier("none");
    Data bytes;
    appendFrame(bytes, FrameKind::call, callId, velmoMessageForPlayerItemGetCurrentTime(item)->serialize());
    return bytes;
}

TEST(HostileClients, WhoSplitsFramesAtEveryByteIsAnsweredAllTheSame) {
    ServiceUnderTest service;
    auto client = service.connectRaw();
    Data stream;
    for (const std::uint64_t id : {1U, 2U, 3U}) {
        const auto query = positionQuery(id);
        stream.insert(stream.end(), query.begin(), query.end());
    }
    for (std::size_t cut = 1; cut < stream.size(); ++cut) {
        ASSERT_TRUE(client.sendBytes(std::span(stream).first(cut)));
        ASSERT_TRUE(client.sendBytes(std::span(stream).subspan(cut)));
        for (const std::uint64_t id : {1U, 2U, 3U})
            ASSERT_EQ(client.receive()->callId, id) << "cut at " << cut;
    }
}

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

TEST(HostileClients, EnvelopesThatCannotBeDecodedCostOneLine) {
    ServiceUnderTest service;
    auto client = service.connectRaw();
    ASSERT_TRUE(client.send(FrameKind::call, 1, "\x12\xFF"));
    EXPECT_EQ(client.receive()->kind, FrameKind::released);
    EXPECT_TRUE(service.logs("failed to initialize protoMessage"));
    ASSERT_TRUE(client.sendBytes(positionQuery(2)));
    EXPECT_EQ(client.receive()->callId, 2U);
}

TEST(HostileClients, FilesWhereNoneBelongAreClosed) {
    ServiceUnderTest service;
    auto good = service.connectRaw();
    ASSERT_TRUE(good.sendBytes(positionQuery(1)));
    ASSERT_TRUE(good.receive());
    WatchedFile file;
    for (int i = 0; i < 30; ++i) {
        auto bad = service.connectRaw();
        bad.sendWithFiles(positionQuery(1), std::vector<int>(i % 2 == 0 ? 1 : 253, file.get()));
        EXPECT_TRUE(bad.isCutOff());
    }
    ASSERT_TRUE(good.sendBytes(positionQuery(2)));
    ASSERT_TRUE(good.receive());
    EXPECT_TRUE(file.isClosed());
}

TEST(HostileClients, WhoDoesNotReadIsCutOffAndNobodyElseNotices) {
    ServiceUnderTest service;
    auto slow = service.connectRaw();
    // The answer repeats the title.
    auto upsert = std::make_shared<VLProtoAudioFilePlayerAssetUpdateMetaData>();
    upsert->setIdentifier("asset");
    upsert->setURL(service.song());
    upsert->setTitle(std::string(200'000, 't'));
    Data call;
    appendFrame(call, FrameKind::call, 1, velmoMessage(std::move(upsert))->serialize());
    while (slow.sendBytes(call)) {
    }
    EXPECT_TRUE(service.logs("does not read"));
    Client next(service.options());
    EXPECT_TRUE(isServed(next, service.song()));
}

TEST(HostileClients, StalledFramesHoldUpNobody) {
    ServiceUnderTest service;
    std::vector<RawClient> stalled;
    for (int i = 0; i < 20; ++i) {
        stalled.push_back(service.connectRaw());
        Data half;
        appendFrame(half, FrameKind::call, 1, Data(FrameHeader::largestBody));
        half.resize(half.size() / 2);
        ASSERT_TRUE(stalled.back().sendBytes(half));
    }
    Client client(service.options());
    EXPECT_TRUE(isServed(client, service.song()));
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
