#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "mediaprotocol/Records.h"
#include "system/HeldFile.h"

namespace tarn {

/// What the programs say to each other, one packet for each message. Every message has a fixed size and
/// begins with its kind; descriptors travel beside it. `docs/media-process.md` tells who says what, and when.
enum class MessageKind : std::uint32_t {
    fork = 1,
    kill,
    childCrashed,
    openPath,
    reopenFile,
    receiveFile,
    dropFile,
    ported,
    childIsIdle,
    examine,
    examined,
    openItem,
    itemOpened,
    seek,
    taken,
    more,
    renderingFailed,
};

/// What can hold a process that reads a stranger's file.
enum LockDown : std::uint32_t {
    lockedSystemCalls = 1, ///< only those that reading, decoding and answering take
    lockedMemory = 2,      ///< no more than its own size and a margin
    lockedEverything = lockedSystemCalls | lockedMemory,
};

/// For people: what is in force.
std::string lockDownText(std::uint32_t locks);

/// What a fork of the parent becomes.
enum class ChildKind : std::uint32_t {
    porter = 1, ///< opens files and receives those of clients; reads none
    examiner,   ///< tells what files say of themselves, one after the other
    renderer,   ///< makes one file's frames
};

// Service to parent.

/// Make a child. Its end of a socket comes along, and to a renderer its ring.
struct ForkRequest {
    MessageKind kind = MessageKind::fork;
    ChildKind child = ChildKind::porter;
    std::uint64_t id = 0; ///< the service's name for it
};

/// End a child, whatever it is doing.
struct KillRequest {
    MessageKind kind = MessageKind::kill;
    std::uint32_t zero = 0;
    std::uint64_t id = 0;
};

// Parent to service.

/// A child ended by a signal that the service did not ask for.
struct ChildCrashed {
    MessageKind kind = MessageKind::childCrashed;
    std::int32_t signal = 0;
    std::uint64_t id = 0;
};

// Service to porter.

/// Open a regular file for reading. Answered by Ported.
struct OpenPath {
    static constexpr std::size_t longest = 4096;

    MessageKind kind = MessageKind::openPath;
    std::uint32_t length = 0;
    std::array<char, longest> path{};
};

/// Two descriptors come along: one that names a file, and a socket to park it in, opened.
struct ReopenFile {
    MessageKind kind = MessageKind::reopenFile;
    std::uint32_t zero = 0;
};

/// Receive `bytes` bytes and the one file that belongs to them from the socket that comes along. Answered by
/// Ported.
struct ReceiveFile {
    MessageKind kind = MessageKind::receiveFile;
    std::uint32_t bytes = 0;
};

/// Take all files out of the socket that comes along, and close them.
struct DropFile {
    MessageKind kind = MessageKind::dropFile;
    std::uint32_t zero = 0;
};

// Porter to service.

/// The file that was asked for comes along, or there is none.
struct Ported {
    enum class Refusal : std::uint32_t { none, cannotOpen, notRegular, notReadable, noFile, notOneFile };

    MessageKind kind = MessageKind::ported;
    Refusal refusal = Refusal::none;
    FileForm form = FileForm::none;
    std::int32_t error = 0; ///< the system's reason, of cannotOpen
    std::uint32_t idle = 0; ///< 1: nothing is left to be done; 0: ChildIsIdle follows
    std::uint32_t zero = 0;
};

/// Of a porter or an examiner: nothing is left to be done that may take long, such as closing a file.
struct ChildIsIdle {
    MessageKind kind = MessageKind::childIsIdle;
    std::uint32_t zero = 0;
};

// Service to examiner, and back.

/// Read what the file that comes along says of itself.
struct Examine {
    MessageKind kind = MessageKind::examine;
    FileForm form = FileForm::open;
};

struct Examined {
    MessageKind kind = MessageKind::examined;
    std::uint32_t locks = 0; ///< what holds the examiner, as bits of LockDown
    std::uint32_t idle = 0;  ///< 1: nothing is left to be done; 0: ChildIsIdle follows
    std::uint32_t zero = 0;
    InfoRecord info;
    TagsRecord tags;
    ErrorRecord error; ///< without one the rest is meaningful
};

// Service to renderer.

/// Open the file that comes along. Answered by ItemOpened.
struct OpenItem {
    MessageKind kind = MessageKind::openItem;
    FileForm form = FileForm::open;
    InfoRecord info;
};

/// Go on at `position` with `rate` in `format`. The ring comes along when it is another one than before; it
/// has room for `capacity` frames.
struct Seek {
    MessageKind kind = MessageKind::seek;
    std::uint32_t generation = 0; ///< one more than before
    std::int64_t position = 0;    ///< nanoseconds
    std::uint32_t rate = 0;       ///< the bits of a float
    FormatRecord format;
    std::uint64_t capacity = 0;
};

/// There is room in the ring again.
struct Taken {
    MessageKind kind = MessageKind::taken;
    std::uint32_t zero = 0;
};

// Renderer to service.

struct ItemOpened {
    MessageKind kind = MessageKind::itemOpened;
    std::uint32_t locks = 0;
    ErrorRecord error;
};

/// What the service waits for is in the ring.
struct More {
    MessageKind kind = MessageKind::more;
    std::uint32_t zero = 0;
};

/// Why the last span of a generation failed; comes before that span.
struct RenderingFailed {
    MessageKind kind = MessageKind::renderingFailed;
    std::uint32_t generation = 0;
    ErrorRecord error;
};

} // namespace tarn
