#pragma once

#include <memory>
#include <optional>

#include "mediaprotocol/Channel.h"
#include "mediaprotocol/RingWriter.h"

namespace tarn {

class FileDecoder;
class FileReader;
class ItemRendering;

/// Makes one file's frames for the service, as far ahead as the ring has room. To be run locked down.
///
/// It fills the ring, in pieces, between which it looks for a seek; then it sleeps until the service says
/// that there is room again.
class Renderer {
public:
    /// `locks` are told with the first answer.
    Renderer(Channel service, RingMemory ring, std::uint32_t locks);
    ~Renderer();

    /// Returns when the service wants no more.
    void run();

private:
    bool serve(ReceivedMessage& message);
    bool open(const OpenItem& request, FileDescriptor file);
    bool seek(const Seek& request);
    bool hasWork() const;
    bool renderPiece();

    const Channel service_;
    const std::uint32_t locks_;
    RingWriter ring_;
    std::unique_ptr<FileReader> reader_;
    std::unique_ptr<FileDecoder> decoder_;
    std::unique_ptr<ItemRendering> rendering_;
    PcmBuffer piece_;
    std::uint32_t generation_ = 0;
    std::size_t pieceFrames_ = 0;
    bool goesOn_ = false; // there is more of the media
};

} // namespace tarn
