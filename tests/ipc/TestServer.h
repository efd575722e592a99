#pragma once

#include <cstdlib>
#include <memory>
#include <string>
#include <utility>

#include "ipc/SocketListeners.h"
#include "media/ClientFiles.h"
#include "player/EventLoopThread.h"
#include "tests/ipc/FakeService.h"
#include "tests/ipc/RawClient.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/TemporaryFolder.h"

namespace tarn {

/// A listener on a socket of its own, with a fake service behind it. Sets XDG_RUNTIME_DIR.
class TestServer {
public:
    explicit TestServer(FakeService::Answer answer = nullptr) : service(std::move(answer)) {
        ::setenv("XDG_RUNTIME_DIR", folder_.path().c_str(), 1);
        listener_ = listeners_.createWithServiceName("ostrel.tarnd");
        listener_->setDelegate(&service);
        listener_->resume();
    }

    std::string path() const { return (folder_ / "ostrel.tarnd").string(); }
    RawClient connect() const { return RawClient(path()); }

    CapturedLog log;
    TokenTable tokens;
    FakeService service;

private:
    TemporaryFolder folder_;
    MediaProcess process_;
    FilePorter porter_{process_};
    EventLoopThread loop_;
    ClientFiles files_{porter_, loop_};
    SocketListeners listeners_{tokens, files_};
    std::unique_ptr<ServiceListener> listener_;
};

} // namespace tarn
