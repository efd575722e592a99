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
/// the other's. All counts only ever grow.
struct RingHeader {
    static constexpr std::size_t mostSpans = 64;

    static_assert(std::atomic<std::uint64_t>::is_always_lock_free);

    // The renderer's half.
    alignas(64) std::atomic<std::uint64_t> bytesWritten;
    std::atomic<std::uint64_t> spansWritten;
    std::array<MediaSpan, mostSpans> spans; ///< number n stands at n modulo mostSpans

    // The service's half.
    alignas(64) std::atomic<std::uint64_t> bytesTaken;
    std::atomic<std::uint64_t> spansTaken;
    std::atomic<std::uint64_t> wanted; ///< how many bytes the service waits for; 0 while it does not
};

/// The memory that a renderer and the service share: output frames on their way, and the spans that tell what
/// they play.
///
/// The service makes it and seals its size, so that nobody can take it away under the other. It is as large
/// as any format needs, once and for all: the renderer maps it before it gives up the right to. What no
/// format has used yet takes no memory.
class RingMemory {
public:
    /// Room for frames, in bytes.
    static constexpr std::size_t size = std::size_t{3} << 20;

    /// The service's. None when the system has none.
    static std::optional<RingMemory> create();

    /// The renderer's: the memory that came with a message. None when it is not that.
    static std::optional<RingMemory> map(const FileDescriptor& memory);

    /// How many frames are kept at hand: two seconds, or what there is room for.
    static std::size_t capacityFor(const PcmFormat& format);

    RingMemory(RingMemory&& other) noexcept;
    RingMemory& operator=(RingMemory&& other) noexcept;
    ~RingMemory();

    RingHeader& header() const { return *static_cast<RingHeader*>(address_); }

    /// `size` bytes.
    std::byte* bytes() const;

    /// What create() made, to be sent to the renderer.
    int descriptor() const { return descriptor_.get(); }

private:
    RingMemory() = default;
    bool mapShared(int memory);

    FileDescriptor descriptor_;
    void* address_ = nullptr;
};

} // namespace tarn
