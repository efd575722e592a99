#include "mediaprotocol/RingMemory.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <utility>

namespace tarn {

namespace {

constexpr std::size_t pageSize = 4096;
constexpr std::size_t headerSize = (sizeof(RingHeader) + pageSize - 1) / pageSize * pageSize;
constexpr std::size_t mappedSize = headerSize + RingMemory::size;
constexpr std::size_t secondsAtHand = 2;

} // namespace

std::optional<RingMemory> RingMemory::create() {
    RingMemory ring;
    ring.descriptor_.reset(::memfd_create("tarn-ring", MFD_CLOEXEC | MFD_ALLOW_SEALING));
    const int memory = ring.descriptor_.get();
    if (memory < 0 || ::ftruncate(memory, static_cast<off_t>(mappedSize)) != 0 ||
        ::fcntl(memory, F_ADD_SEALS, F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_SEAL) != 0)
        return std::nullopt;
    return ring.mapShared(memory) ? std::optional(std::move(ring)) : std::nullopt;
}

std::optional<RingMemory> RingMemory::map(const FileDescriptor& memory) {
    RingMemory ring;
    return ring.mapShared(memory.get()) ? std::optional(std::move(ring)) : std::nullopt;
}

bool RingMemory::mapShared(int memory) {
    void* address = ::mmap(nullptr, mappedSize, PROT_READ | PROT_WRITE, MAP_SHARED, memory, 0);
    if (address == MAP_FAILED)
        return false;
    address_ = address;
    return true;
}

std::size_t RingMemory::capacityFor(const PcmFormat& format) {
    return std::min<std::size_t>(secondsAtHand * format.rate, size / format.bytesPerFrame());
}

RingMemory::RingMemory(RingMemory&& other) noexcept
    : descriptor_(std::move(other.descriptor_)), address_(std::exchange(other.address_, nullptr)) {}

RingMemory& RingMemory::operator=(RingMemory&& other) noexcept {
    std::swap(descriptor_, other.descriptor_);
    std::swap(address_, other.address_);
    return *this;
}

RingMemory::~RingMemory() {
    if (address_ != nullptr)
        ::munmap(address_, mappedSize);
}

std::byte* RingMemory::bytes() const { return static_cast<std::byte*>(address_) + headerSize; }

} // namespace tarn
