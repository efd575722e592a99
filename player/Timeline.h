#pragma once

#include <chrono>
#include <cstdint>
#include <deque>
#include <optional>

#include "roles/Error.h"

namespace tarn {

/// One playing of one item in one queue; never used again for another.
using EntryId = std::uint64_t;

/// What an output's frames play: output frames <-> (queue entry, position in its media).
///
/// Spans follow one another without overlap, in the order in which they are heard, and within a span the
/// media moves evenly; so a position is exact through every change of rate. A frame that no span holds
/// belongs to something that was thrown out of the queue while it could no longer be taken back. A plain
/// value without a lock.
class Timeline {
public:
    enum class End : std::uint8_t { none, completed, failed };

    struct Span {
        EntryId entry = 0;
        std::int64_t firstFrame = 0;
        std::int64_t endFrame = 0; ///< one behind the last
        std::chrono::nanoseconds start{0};
        std::chrono::nanoseconds end{0};
        bool backwards = false;
        End ending = End::none; ///< does the entry end with this span?
        std::optional<Error> error{};

        /// The media's position at `frame`, which is taken into the span when it lies outside.
        std::chrono::nanoseconds positionAt(std::int64_t frame) const;
    };

    const std::deque<Span>& spans() const { return spans_; }

    /// `span` begins at or behind the end of what is there.
    void append(Span span);

    /// Where `entry` is while `frame` is heard: before its first frame at its start, behind its last at its
    /// end. None when it has no span.
    std::optional<std::chrono::nanoseconds> positionOf(EntryId entry, std::int64_t frame) const;

    /// The span with which `entry` ends, if that has been rendered.
    const Span* endOf(EntryId entry) const;

    /// Forgets what has been heard when `frame` is heard, but keeps the last span, which says where to go on.
    void forgetBefore(std::int64_t frame);

    /// Nothing is rendered from `frame` on. The span that holds it ends there, and the first one stays even
    /// when nothing is left of it; the last one that stays goes on, it does not end its entry.
    void cut(std::int64_t frame);

    /// Drops the spans from the one at `index` on.
    void dropFrom(std::size_t index) { spans_.resize(index); }

    void clear() { spans_.clear(); }

private:
    std::deque<Span> spans_;
};

} // namespace tarn
