#pragma once

#include "mediaprotocol/RingMemory.h"
#include "pcm/PcmBuffer.h"

namespace tarn {

/// The renderer's side of a ring. Used by one thread.
class RingWriter {
public:
    explicit RingWriter(RingMemory memory) : memory_(std::move(memory)) {}

    std::size_t capacity() const { return memory_.capacity(); }

    /// For how many frames there is room; 0 also when there is none for another span.
    std::size_t room() const;

    /// Adds `span`, whose frames are those of `buffer`. There is room.
    void put(const PcmBuffer& buffer, MediaSpan span);

    /// Does the service wait, and is what it waits for there? True once for each time that it waits.
    bool owesWord() const;

private:
    RingMemory memory_;
    std::uint64_t frames_ = 0;
    std::uint64_t spans_ = 0;
    bool complete_ = false; // nothing follows the last span
};

} // namespace tarn
