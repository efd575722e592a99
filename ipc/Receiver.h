#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "ipc/ReceivedFile.h"

namespace tarn {

/// What one read of a socket gave.
struct Received {
    enum class State { open, nothingNow, ended, truncatedFiles };

    State state = State::open;
    std::span<const std::uint8_t> bytes; // good until the next read
    std::vector<ReceivedFile> files;     // close-on-exec
};

/// Reads sockets, with the files that come along. Belongs to one thread.
class Receiver {
public:
    enum class Wait { never, forFirstByte };

    /// Whatever files came are in the result or closed.
    Received receive(int socket, Wait wait = Wait::never);

    /// For a socket that is about to be closed: ends its receiving side and drops what came and was not read,
    /// as the files among it would else be closed with the socket, by the thread that does that.
    void drain(int socket);

private:
    static constexpr std::size_t size = 65'536;

    std::unique_ptr<std::uint8_t[]> buffer_ = std::make_unique_for_overwrite<std::uint8_t[]>(size);
};

} // namespace tarn
