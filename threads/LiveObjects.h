#pragma once

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>

namespace tarn {

/// How many objects of each counted kind exist, for tests and diagnosis: after a client is gone, all of its
/// objects must be. Any thread may call.
class LiveObjects {
public:
    /// Every kind of which an object was ever made, with the number that lives now.
    static std::map<std::string, std::int64_t> counts();

    /// The counter of one kind.
    class Kind {
    public:
        explicit Kind(const char* name);
        void add(std::int64_t change) { count_.fetch_add(change, std::memory_order_relaxed); }

    private:
        friend class LiveObjects;
        const char* name_;
        std::atomic<std::int64_t> count_{0};
        Kind* next_;
    };
};

/// A string that can be a template argument.
template <std::size_t size>
struct KindName {
    constexpr KindName(const char (&text)[size]) { std::copy_n(text, size, characters); }
    char characters[size];
};

/// Held as a member, counts its owner as one living object: `LiveObject<"router"> live_;`.
template <KindName name>
class LiveObject {
public:
    LiveObject() { kind().add(1); }
    LiveObject(const LiveObject&) { kind().add(1); }
    LiveObject& operator=(const LiveObject&) = default;
    ~LiveObject() { kind().add(-1); }

private:
    static LiveObjects::Kind& kind() {
        static LiveObjects::Kind kind(name.characters);
        return kind;
    }
};

} // namespace tarn
