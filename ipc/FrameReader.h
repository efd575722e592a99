#pragma once

#include <cstdint>
#include <deque>
#include <initializer_list>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "ipc/Frame.h"

namespace tarn {

/// Cuts what a stream socket delivers into frames, however the bytes were split. Not thread-safe.
///
/// A file belongs to the extension frame with whose bytes it came. What does not fit the rules breaks the
/// stream for good: bytes after that are not looked at.
class FrameReader {
public:
    /// Who sends the frames that are read: each side has kinds of its own.
    enum class Sender { client, service };

    explicit FrameReader(Sender sender) : sender_(sender) {}

    /// Takes the bytes and files of one read and appends the frames that are now whole to `frames`. Returns
    /// why the stream is broken, or nothing; frames before the break have been appended.
    std::optional<std::string_view> take(std::span<const std::uint8_t> bytes, std::vector<ReceivedFile> files,
                                         std::vector<Frame>& frames);

    /// Bytes of a frame that is not whole yet.
    std::size_t unfinishedBytes() const { return unfinished_.size(); }

private:
    std::span<const std::uint8_t> cutFrames(std::span<const std::uint8_t> bytes, std::vector<Frame>& frames);
    bool check(const FrameHeader& header);
    bool takeFile(Frame& frame);
    void checkLeftOverFiles();
    bool mayComeFromSender(FrameKind kind) const;

    Sender sender_;
    Data unfinished_;
    std::deque<ReceivedFile> files_; // came with bytes of a frame that is not whole yet
    std::optional<std::string_view> broken_;
};

} // namespace tarn
