#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <optional>

#include "mediaprotocol/MediaSpan.h"
#include "pcm/PcmFormat.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// What stands at the beginning of a ring. Each side writes its own half and never believes what it reads in
/// the other's.
struct RingHeader {
    static constexpr std::size_t mostSpans = 64;

    static_assert(std::atomic<std::uint64_t>::is_always_lock_free);

    // The renderer's half. All counts only ever grow.
    alignas(64) std::atomic<std::uint64_t> framesWritten;
    std::atomic<std::uint64_t> spansWritten;
    std::array<MediaSpan, mostSpans> spans; ///< number n stands at n modulo mostSpans

    // The service's half.
    alignas(64) std::atomic<std::uint64_t> framesTaken;
    std::atomic<std::uint64_t> spansTaken;
    std::atomic<std::uint64_t> wanted; ///< how many frames the service waits for; 0 while it does not
};

/// The memory that a renderer and the service share: output frames on their way, and the spans that tell what
/// they play. The service makes it and seals its size, so that nobody can take it away under the other.
class RingMemory {
public:
    /// The service's: room for `capacity` frames of `format`. None when the system has none.
    static std::optional<RingMemory> create(const PcmFormat& format, std::size_t capacity);

    /// The renderer's: the memory that came with a message. None when it is too small.
    static std::optional<RingMemory> map(const FileDescriptor& memory, const PcmFormat& format,
                                         std::size_t capacity);

    RingMemory(RingMemory&& other) noexcept;
    RingMemory& operator=(RingMemory&& other) noexcept;
    ~RingMemory();

    RingHeader& header() const { return *static_cast<RingHeader*>(address_); }
    std::size_t capacity() const { return capacity_; }
    std::size_t frameSize() const { return frameSize_; }

    /// What create() made, to be sent to the renderer.
    int descriptor() const { return descriptor_.get(); }

    /// Where the frame with this count lies.
    std::byte* frame(std::uint64_t count) const;

private:
    RingMemory() = default;
    bool mapShared(int memory, const PcmFormat& format, std::size_t capacity);

    FileDescriptor descriptor_;
    void* address_ = nullptr;
    std::size_t size_ = 0;
    std::size_t capacity_ = 0;
    std::size_t frameSize_ = 0;
};

} // namespace tarn
