#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>

namespace tarn {

/// What one read of a socket gave.
struct Received {
    enum class State {
        open,
        nothingNow,
        ended,
        withFiles, ///< files belong to the bytes; both are still in the socket
    };

    State state = State::open;
    std::span<const std::uint8_t> bytes; // good until the next read
};

/// Reads sockets. Belongs to one thread. No file that comes along is ever opened here.
class Receiver {
public:
    /// For a socket on which no files are expected: one that comes is let go, and is taken for the end.
    Received receive(int socket);

    /// For a socket on which files may come. They are left there, with the bytes that they belong to. When
    /// much is there `withFiles` may be said of bytes that come before those of a file: a look that fills the
    /// buffer tells of every file that waits.
    Received receiveUpToFiles(int socket);

    /// For a socket that is about to be closed: ends its receiving side and drops what came and was not read.
    /// True when files are left in it: closing it may take as long as closing them does.
    [[nodiscard]] bool drain(int socket);

private:
    Received read(int socket, int flags);

    static constexpr std::size_t size = 65'536;

    std::unique_ptr<std::uint8_t[]> buffer_ = std::make_unique_for_overwrite<std::uint8_t[]>(size);
};

} // namespace tarn
