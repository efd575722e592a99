#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <utility>

#include "roles/SandboxExtension.h"
#include "system/FileAccess.h"
#include "system/FileReceiver.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// The open files that clients have granted: each waits under its token until the token is consumed or its
/// connection ends, and is then held under its path until the handle is released. Any thread may call.
class TokenTable final : public SandboxExtension, public FileAccess {
public:
    static constexpr std::size_t mostWaiting = 64; // per connection
    static constexpr std::size_t longestToken = 256;
    static constexpr std::size_t longestPath = 4'095; // what the system opens

    /// Makes `token` good for `path`, in place of what the same connection granted under it before. Returns
    /// why it does not, or nothing.
    std::string_view grant(std::uint64_t connection, const std::string& token, const std::string& path,
                           ReceivedFile file);

    /// The connection ended: its tokens are good for nothing; handles stay.
    void forget(std::uint64_t connection);

    std::int64_t consume(const char* token) override;
    void release(std::int64_t handle) override;
    SharedFile open(const std::string& path) override;

private:
    struct GrantedFile {
        std::string path;
        SharedFile file;
    };
    using Waiting = std::map<std::string, GrantedFile, std::less<>>; // by token

    struct State {
        std::map<std::uint64_t, Waiting, std::greater<>> waiting; // by connection, the newest first
        std::map<std::int64_t, GrantedFile, std::greater<>> held; // by handle, the newest first
        std::int64_t nextHandle = 0;
    };

    MutexProtected<State> state_;
};

} // namespace tarn
