// A stream of bytes and files gives the same frames however it is split, loses no file, and ends in the same
// way; and no body of a frame does harm.

#include <fcntl.h>

#include <algorithm>
#include <cstdlib>
#include <string>
#include <tuple>

#include "ipc/FrameReader.h"
#include "ipc/TransportMessages.h"
#include "wire/ProtoWriter.h"

namespace {

using namespace tarn;

struct Outcome {
    std::vector<Frame> frames;
    std::string broken;

    bool operator==(const Outcome& other) const {
        const auto content = [](const Frame& frame) {
            return std::tuple(frame.kind, frame.callId, frame.body, static_cast<bool>(frame.file));
        };
        return broken == other.broken &&
               std::equal(
                   frames.begin(), frames.end(), other.frames.begin(), other.frames.end(),
                   [&](const Frame& left, const Frame& right) { return content(left) == content(right); });
    }
};

/// Hands over the stream in pieces; a file comes with the first piece when `withFile` says so.
Outcome readIn(std::span<const std::uint8_t> stream, std::size_t pieceLength, FrameReader::Sender sender,
               bool withFile) {
    FrameReader reader(sender);
    Outcome outcome;
    for (std::size_t at = 0; at < stream.size() && outcome.broken.empty(); at += pieceLength) {
        std::vector<ReceivedFile> files;
        if (at == 0 && withFile)
            files.push_back(
                {{FileForm::open, FileDescriptor(::open("/dev/null", O_RDONLY | O_CLOEXEC))}, {}});
        const auto piece = stream.subspan(at, std::min(pieceLength, stream.size() - at));
        outcome.broken = reader.take(piece, std::move(files), outcome.frames).value_or("");
        if (reader.unfinishedBytes() > FrameHeader::size + FrameHeader::largestBody)
            std::abort();
    }
    return outcome;
}

void require(bool holds) {
    if (!holds)
        std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 2)
        return 0;
    const auto sender = (data[0] & 1U) != 0 ? FrameReader::Sender::client : FrameReader::Sender::service;
    const bool withFile = (data[0] & 2U) != 0;
    const std::size_t pieceLength = std::size_t{data[1]} + 1;
    const std::span stream(data + 2, size - 2);

    const auto whole = readIn(stream, std::max<std::size_t>(stream.size(), 1), sender, false);
    require(whole == readIn(stream, pieceLength, sender, false));
    require(whole == readIn(stream, 1, sender, false));
    // Which piece a file comes with is the sender's choice, and decides whether it belongs: only survival
    // counts.
    readIn(stream, pieceLength, sender, withFile);

    for (const auto& frame : whole.frames) {
        Data again;
        appendFrame(again, frame.kind, frame.callId, frame.body);
        require(readIn(again, again.size(), sender, frame.kind == FrameKind::extension).frames.size() == 1);
        if (const auto extension = decodeExtension(frame.body))
            require(decodeExtension(encodeExtension(*extension)).has_value());
        if (const auto reply = decodeReply(frame.body)) {
            ProtoWriter encoded;
            writeReply(reply->data, reply->error, encoded);
            require(decodeReply(encoded.bytes()).has_value());
        }
    }
    return 0;
}
