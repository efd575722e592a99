#pragma once

#include <algorithm>
#include <array>
#include <atomic>
#include <cstddef>
#include <memory>
#include <mutex>
#include <new>
#include <utility>

namespace tarn {

/// Keeps blocks of one size that were let go, for the next objects of that size. A command is several small
/// objects, and the heap would be half of what it costs.
///
/// Every thread has a few blocks of its own. One that has too many leaves half of them in a depot, and one
/// that has none fetches as many there: what the I/O thread makes, a worker lets go.
template <std::size_t blockSize>
class BlockCache {
public:
    static void* take() {
        const bool isEmptyOrClosed = own.count - 1 >= capacity;
        if (isEmptyOrClosed && !fetch())
            return ::operator new(blockSize);
        return own.blocks[--own.count];
    }

    static void give(void* block) noexcept {
        if (own.count >= capacity && !leave()) {
            ::operator delete(block);
            return;
        }
        [[maybe_unused]] thread_local const Emptier emptier;
        own.blocks[own.count++] = block;
    }

private:
#ifdef TARN_SANITIZED
    static constexpr std::size_t capacity = 0; // a block that is used again hides its misuse
#else
    static constexpr std::size_t capacity = 32;
#endif
    static constexpr bool isInUse = capacity > 0;
    static constexpr std::size_t batch = capacity / 2;
    static constexpr std::size_t depotCapacity = 8 * batch;
    static constexpr std::size_t closed = capacity + 1;

    struct Own {
        std::array<void*, capacity> blocks;
        std::size_t count;
    };
    struct Depot {
        std::mutex mutex;
        std::array<void*, depotCapacity> blocks{};
        std::atomic<std::size_t> count = 0; // changed under the lock
    };

    /// Runs when the thread ends. Objects that are let go even later find the cache closed.
    struct Emptier {
        ~Emptier() {
            while (own.count > 0)
                ::operator delete(own.blocks[--own.count]);
            own.count = closed;
        }
    };

    /// Fills an empty cache; false when it is closed or there is nothing to be had.
    static bool fetch() noexcept {
        if (!isInUse || own.count != 0 || depot.count == 0)
            return false;
        std::lock_guard lock(depot.mutex);
        own.count = std::min(batch, depot.count.load());
        depot.count -= own.count;
        std::copy_n(depot.blocks.begin() + depot.count, own.count, own.blocks.begin());
        return own.count > 0;
    }

    /// Makes room in a full cache; false when it is closed or the depot is full.
    static bool leave() noexcept {
        if (!isInUse || own.count == closed || depot.count == depotCapacity)
            return false;
        std::lock_guard lock(depot.mutex);
        const std::size_t count = std::min(batch, depotCapacity - depot.count);
        own.count -= count;
        std::copy_n(own.blocks.begin() + own.count, count, depot.blocks.begin() + depot.count);
        depot.count += count;
        return count > 0;
    }

    static inline constinit thread_local Own own{};
    static inline Depot depot;
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

/// std::make_shared for objects that come and go with every command.
template <class Object, class... Arguments>
std::shared_ptr<Object> makeCached(Arguments&&... arguments) {
    return std::allocate_shared<Object>(CachingAllocator<Object>(), std::forward<Arguments>(arguments)...);
}

} // namespace tarn
