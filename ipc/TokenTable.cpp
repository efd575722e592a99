#include "ipc/TokenTable.h"

#include <utility>

namespace tarn {

std::string_view TokenTable::grant(std::uint64_t connection, const std::string& token,
                                   const std::string& path, ReceivedFile file) {
    if (!file.refusal.empty())
        return file.refusal;
    if (token.size() > longestToken || path.size() > longestPath)
        return "the token or the path is too long";
    auto shared = std::make_shared<const HeldFile>(std::move(file.file)); // gets what is displaced
    return state_.withLocked([&](State& state) -> std::string_view {
        auto& tokens = state.waiting[connection];
        if (tokens.size() >= mostWaiting && !tokens.contains(token))
            return "too many tokens of this client wait";
        auto& granted = tokens[token];
        granted.path = path;
        std::swap(granted.file, shared);
        return {};
    });
}

void TokenTable::forget(std::uint64_t connection) {
    auto gone = state_.withLocked([&](State& state) { return state.waiting.extract(connection); });
}

std::int64_t TokenTable::consume(const char* token) {
    return state_.withLocked([&](State& state) -> std::int64_t {
        for (auto& [connection, tokens] : state.waiting) {
            const auto found = tokens.find(std::string_view(token));
            if (found == tokens.end())
                continue;
            const auto handle = state.nextHandle++;
            state.held.emplace(handle, std::move(found->second));
            tokens.erase(found);
            return handle;
        }
        return -1;
    });
}

void TokenTable::release(std::int64_t handle) {
    auto gone = state_.withLocked([&](State& state) { return state.held.extract(handle); });
}

SharedFile TokenTable::open(const std::string& path) {
    return state_.withLocked([&](State& state) -> SharedFile {
        for (const auto& [handle, granted] : state.held)
            if (granted.path == path)
                return granted.file;
        return nullptr;
    });
}

} // namespace tarn
