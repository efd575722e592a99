// The two programs that handle media never believe each other: whatever stands in a ring or a message, the
// service takes no frame that is not there, and a renderer gets no further than to its end.

#include <sys/mman.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <span>
#include <string>

#include "mediaprocess/Renderer.h"
#include "mediaprotocol/RingReader.h"

namespace {

using namespace tarn;
using Bytes = std::span<const std::uint8_t>;

void check(bool holds) {
    if (!holds)
        std::abort();
}

/// The beginning of `bytes`, which it loses, as a value; zeros when they do not suffice.
template <class Value>
Value take(Bytes& bytes) {
    Value value{};
    const std::size_t size = std::min(sizeof value, bytes.size());
    std::memcpy(static_cast<void*>(&value), bytes.data(), size);
    bytes = bytes.subspan(size);
    return value;
}

RingMemory anyRing() {
    auto ring = RingMemory::create();
    check(ring.has_value());
    return *std::move(ring);
}

/// The renderer's half of the ring changes with every step.
void readRing(Bytes bytes) {
    RingMemory writers = anyRing();
    auto readers = RingMemory::map(FileDescriptor(::dup(writers.descriptor())));
    check(readers.has_value());
    RingReader reader(*std::move(readers));
    const PcmFormat format{SampleFormat::s16, 44100, 2};
    reader.begin(take<std::uint8_t>(bytes), format);
    PcmBuffer buffer;
    while (!bytes.empty()) {
        RingHeader& header = writers.header();
        const auto place = take<std::uint8_t>(bytes) % RingHeader::mostSpans;
        const auto more = take<std::uint16_t>(bytes);
        header.spans[place] = take<MediaSpan>(bytes);
        header.bytesWritten += more & 0xFFF;
        header.spansWritten += more >> 14;
        const std::size_t before = buffer.frames;
        const RingReader::Taken taken = reader.take(buffer, 500);
        check(buffer.bytes.size() == buffer.frames * format.bytesPerFrame());
        check(buffer.frames - before <= 500);
        if (taken.what == RingReader::Taken::What::lie)
            return;
        if (taken.what == RingReader::Taken::What::span)
            check(taken.span.frames == buffer.frames - before && taken.span.start >= 0 &&
                  taken.span.end >= 0);
        else
            reader.want(more);
    }
}

template <class Message>
void checkTexts(Bytes bytes) {
    auto message = take<Message>(bytes);
    if (const auto info = message.info.checked()) {
        AudioFileInfo copy = *info;
        check(copy.format.channels > 0 && copy.format.rate > 0);
        if constexpr (requires { message.tags; })
            static_cast<void>(message.tags.copyTo(copy));
    }
    if constexpr (requires { message.error; })
        check(message.error.toError().domain.size() > 0);
}

/// A file that the renderer can play: half a second of WAV.
const FileDescriptor& song() {
    static const FileDescriptor file = [] {
        FileDescriptor made(::memfd_create("song", MFD_CLOEXEC));
        std::string wav(
            "RIFF\x24\x58\x01\x00WAVEfmt \x10\x00\x00\x00\x01\x00\x02\x00\x44\xac\x00\x00\x10\xb1\x02\x00"
            "\x04\x00\x10\x00"
            "data\x00\x58\x01\x00",
            44);
        wav.append(88064, '\x11');
        check(::write(made.get(), wav.data(), wav.size()) == static_cast<ssize_t>(wav.size()));
        return made;
    }();
    return file;
}

template <class Message>
void send(const Channel& service, Bytes& bytes, std::span<const int> files = {}) {
    auto message = take<Message>(bytes);
    message.kind = Message{}.kind;
    static_cast<void>(service.send(message, files));
}

void runRenderer(Bytes bytes) {
    RingMemory ring = anyRing();
    auto renderers = RingMemory::map(FileDescriptor(::dup(ring.descriptor())));
    auto ends = Channel::makePair();
    check(renderers && ends);
    const int file = song().get();
    OpenItem open;
    open.info = take<InfoRecord>(bytes);
    static_cast<void>(ends->first.send(open, std::span(&file, 1)));
    for (int count = 0; !bytes.empty() && count < 20; ++count) {
        switch (take<std::uint8_t>(bytes) % 4) {
        case 0:
            send<Taken>(ends->first, bytes);
            break;
        case 1:
            send<OpenItem>(ends->first, bytes, std::span(&file, 1));
            break;
        default:
            send<Seek>(ends->first, bytes);
        }
    }
    ::shutdown(ends->first.socket(), SHUT_WR);
    Renderer(std::move(ends->second), *std::move(renderers), 0).run();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size == 0)
        return 0;
    const Bytes bytes(data + 1, size - 1);
    switch (data[0] % 4) {
    case 0:
        readRing(bytes);
        break;
    case 1:
        checkTexts<Examined>(bytes);
        break;
    case 2:
        checkTexts<OpenItem>(bytes);
        break;
    default:
        runRenderer(bytes);
    }
    return 0;
}
