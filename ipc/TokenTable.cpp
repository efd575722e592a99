#include "ipc/TokenTable.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>

namespace tarn {

namespace {

/// Why the file cannot be played from; empty when it can.
std::string_view unfitness(int file) {
    // What the system knows by itself will do: asking whoever serves the file may take for ever.
    struct statx status {};
    if (::statx(file, "", AT_EMPTY_PATH | AT_STATX_DONT_SYNC, STATX_TYPE, &status) != 0 ||
        !S_ISREG(status.stx_mode))
        return "it is not a regular file";
    const int flags = ::fcntl(file, F_GETFL);
    if (flags < 0 || (flags & O_PATH) != 0 || (flags & O_ACCMODE) == O_WRONLY)
        return "it is not open for reading";
    return {};
}

} // namespace

std::string_view TokenTable::grant(std::uint64_t connection, const std::string& token,
                                   const std::string& path, ReceivedFile file) {
    if (const auto reason = unfitness(file.get()); !reason.empty())
        return reason;
    // `file` gets what is displaced, to be closed after the lock has been let go.
    return state_.withLocked([&](State& state) -> std::string_view {
        auto& tokens = state.waiting[connection];
        if (tokens.size() >= mostWaiting && !tokens.contains(token))
            return "too many tokens of this client wait";
        auto& granted = tokens[token];
        granted.path = path;
        std::swap(granted.file, file);
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
                return std::make_shared<HeldFile>(HeldFile{
                    FileForm::open, FileDescriptor(::fcntl(granted.file.get(), F_DUPFD_CLOEXEC, 0))});
        return nullptr;
    });
}

} // namespace tarn
