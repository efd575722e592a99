#pragma once

#include <array>
#include <cstddef>
#include <memory>
#include <new>

namespace tarn {

/// Keeps a few blocks of one size that this thread has let go, for the next messages that it makes. A message
/// is several small objects, and the heap would be half of what it costs. A thread that only makes messages,
/// or only lets them go, gains and loses nothing.
template <std::size_t blockSize>
class BlockCache {
public:
    static void* take() {
        if (count > 0)
            return blocks[--count];
        return ::operator new(blockSize);
    }

    static void give(void* block) noexcept {
        if (count < capacity) {
            [[maybe_unused]] thread_local const Emptier emptier;
            blocks[count++] = block;
        } else {
            ::operator delete(block);
        }
    }

private:
#ifdef TARN_SANITIZED
    static constexpr std::size_t capacity = 0; // a block that is used again hides its misuse
#else
    static constexpr std::size_t capacity = 16;
#endif

    /// Runs when the thread ends. Objects that are let go even later find the cache closed.
    struct Emptier {
        ~Emptier() {
            while (count > 0)
                ::operator delete(blocks[--count]);
            count = closed;
        }
    };
    static constexpr std::size_t closed = capacity + 1;
    static inline thread_local std::array<void*, capacity> blocks;
    static inline thread_local std::size_t count = 0;
};

/// For std::allocate_shared.
template <class Object>
struct CachingAllocator {
    using value_type = Object;

    CachingAllocator() = default;
    template <class Other>
    CachingAllocator(const CachingAllocator<Other>&) noexcept {}

    Object* allocate(std::size_t) { return static_cast<Object*>(BlockCache<sizeof(Object)>::take()); }
    void deallocate(Object* object, std::size_t) noexcept { BlockCache<sizeof(Object)>::give(object); }

    template <class Other>
    bool operator==(const CachingAllocator<Other>&) const noexcept {
        return true;
    }
};

/// An empty message. Unlike std::make_shared it does not clear the memory first: messages initialize all of
/// it.
template <class Message>
std::shared_ptr<Message> newMessage() {
    return std::allocate_shared_for_overwrite<Message>(CachingAllocator<Message>());
}

} // namespace tarn
