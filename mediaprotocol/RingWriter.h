#pragma once

#include "mediaprotocol/RingMemory.h"
#include "pcm/PcmBuffer.h"

namespace tarn {

/// The renderer's side of a ring. Used by one thread.
class RingWriter {
public:
    explicit RingWriter(RingMemory memory) : memory_(std::move(memory)) {}

    /// From here on frames of this format are written, and at most `capacity` kept: what was written before
    /// is of no use any more. False when there is no room for so many.
    [[nodiscard]] bool begin(const PcmFormat& format, std::uint64_t capacity);

    /// For how many frames there is room; 0 also when there is none for another span.
    std::size_t room() const;

    /// Adds `span`, whose frames are those of `buffer`. There is room.
    void put(const PcmBuffer& buffer, MediaSpan span);

    /// Does the service wait, and is what it waits for there? True once for each time that it waits.
    bool owesWord() const;

private:
    std::uint64_t heldBytes() const;

    RingMemory memory_;
    std::size_t capacity_ = 0; // in bytes
    std::size_t frameSize_ = 1;
    std::uint64_t begin_ = 0; // what bytes_ was when this format began
    std::uint64_t bytes_ = 0;
    std::uint64_t spans_ = 0;
    bool complete_ = false; // nothing follows the last span
};

} // namespace tarn
