#pragma once

#include <cstdint>
#include <memory>

#include "ipc/ConnectionSocket.h"
#include "roles/ServiceConnection.h"

namespace tarn {

/// The callback of one call, on the connection that the call came on. The call is finished when this goes;
/// when it goes uncalled, the client is told so.
class CallAnswer final : public ClientCallback {
public:
    /// `callId` 0: the client wants no answer, so none is sent. `bytes` is the length of the call.
    CallAnswer(std::shared_ptr<ConnectionSocket> socket, std::uint64_t callId, std::size_t bytes);
    ~CallAnswer() override;

    // Every call has one.
    static void* operator new(std::size_t size);
    static void operator delete(void* block) noexcept;

    void call(std::optional<Data> data, const std::optional<Error>& error) override;

private:
    const std::shared_ptr<ConnectionSocket> socket_;
    const std::uint64_t callId_;
    const std::size_t bytes_;
    bool answered_ = false;
};

} // namespace tarn
