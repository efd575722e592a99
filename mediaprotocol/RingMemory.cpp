#include "mediaprotocol/RingMemory.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <utility>

namespace tarn {

namespace {

constexpr std::size_t pageSize = 4096;
constexpr std::size_t headerSize = (sizeof(RingHeader) + pageSize - 1) / pageSize * pageSize;

std::size_t sizeFor(const PcmFormat& format, std::size_t capacity) {
    return headerSize + capacity * format.bytesPerFrame();
}

} // namespace

std::optional<RingMemory> RingMemory::create(const PcmFormat& format, std::size_t capacity) {
    RingMemory ring;
    ring.descriptor_.reset(::memfd_create("tarn-ring", MFD_CLOEXEC | MFD_ALLOW_SEALING));
    const int memory = ring.descriptor_.get();
    if (memory < 0 || ::ftruncate(memory, static_cast<off_t>(sizeFor(format, capacity))) != 0 ||
        ::fcntl(memory, F_ADD_SEALS, F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_SEAL) != 0)
        return std::nullopt;
    return ring.mapShared(memory, format, capacity) ? std::optional(std::move(ring)) : std::nullopt;
}

std::optional<RingMemory> RingMemory::map(const FileDescriptor& memory, const PcmFormat& format,
                                          std::size_t capacity) {
    RingMemory ring;
    return ring.mapShared(memory.get(), format, capacity) ? std::optional(std::move(ring)) : std::nullopt;
}

bool RingMemory::mapShared(int memory, const PcmFormat& format, std::size_t capacity) {
    const std::size_t size = sizeFor(format, capacity);
    void* address = ::mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED, memory, 0);
    if (capacity == 0 || address == MAP_FAILED)
        return false;
    address_ = address;
    size_ = size;
    capacity_ = capacity;
    frameSize_ = format.bytesPerFrame();
    return true;
}

RingMemory::RingMemory(RingMemory&& other) noexcept
    : descriptor_(std::move(other.descriptor_)),
      address_(std::exchange(other.address_, nullptr)),
      size_(other.size_),
      capacity_(other.capacity_),
      frameSize_(other.frameSize_) {}

RingMemory& RingMemory::operator=(RingMemory&& other) noexcept {
    std::swap(descriptor_, other.descriptor_);
    std::swap(address_, other.address_);
    std::swap(size_, other.size_);
    std::swap(capacity_, other.capacity_);
    std::swap(frameSize_, other.frameSize_);
    return *this;
}

RingMemory::~RingMemory() {
    if (address_ != nullptr)
        ::munmap(address_, size_);
}

std::byte* RingMemory::frame(std::uint64_t count) const {
    return static_cast<std::byte*>(address_) + headerSize +
           static_cast<std::size_t>(count % capacity_) * frameSize_;
}

} // namespace tarn
