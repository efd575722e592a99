#include "decoder/FlacSearch.h"

#include <algorithm>
#include <limits>

#include "decoder/Bytes.h"

namespace tarn {

namespace {

constexpr std::int64_t closeEnough = std::int64_t{32} * 1024;
constexpr std::size_t longestHeader = 16;
constexpr std::int64_t largestFrame = 1 << 20; // eight channels of 32 bits could need more; no music does

// The way blocks are numbered, the rate and the width of samples are the same in all frames of a file: that
// leaves few bytes of audio that look like a header.
unsigned constantBits(std::string_view header) {
    return (static_cast<unsigned>(header[1]) & 1) << 16 | (static_cast<unsigned>(header[2]) & 15) << 8 |
           (static_cast<unsigned>(header[3]) & 14);
}

} // namespace

FlacSearch::FlacSearch(ByteSource& source, std::int64_t firstFrame, std::int64_t blockSize)
    : source_(source), firstFrame_(firstFrame), blockSize_(blockSize) {
    const std::string header = readPiece(source, firstFrame, longestHeader);
    constantBits_ = header.size() < longestHeader ? 0 : constantBits(header);
}

std::optional<FlacSearch::Place> FlacSearch::at(std::string_view bytes, std::int64_t offset) const {
    const auto frame = FlacFrame::parse(bytes.substr(0, longestHeader), blockSize_);
    if (!frame || constantBits(bytes) != constantBits_)
        return std::nullopt;
    return Place{offset, *frame};
}

std::optional<FlacSearch::Place> FlacSearch::firstIn(std::int64_t begin, std::int64_t end) const {
    for (std::int64_t piece = begin; piece < end; piece += closeEnough) {
        const auto size = static_cast<std::size_t>(std::min(closeEnough, end - piece)) + longestHeader;
        const std::string bytes = readPiece(source_, piece, size);
        const std::string_view view = bytes;
        for (std::size_t i = view.find('\xFF'); i < view.size(); i = view.find('\xFF', i + 1))
            if (const auto place = at(view.substr(i), piece + static_cast<std::int64_t>(i)))
                return place;
    }
    return std::nullopt;
}

std::optional<FlacSearch::Place> FlacSearch::lastIn(std::int64_t begin, std::int64_t end,
                                                    std::int64_t target) const {
    const std::string bytes =
        readPiece(source_, begin, static_cast<std::size_t>(end - begin) + longestHeader);
    const std::string_view view = bytes;
    std::optional<Place> last;
    for (std::size_t i = view.find('\xFF'); i < view.size(); i = view.find('\xFF', i + 1)) {
        const auto place = at(view.substr(i), begin + static_cast<std::int64_t>(i));
        if (place && place->frame.first <= target && (!last || place->frame.first > last->frame.first))
            last = place;
    }
    return last;
}

std::optional<FlacSearch::Place> FlacSearch::lastUntil(std::int64_t target) const {
    std::int64_t low = firstFrame_; // a frame that begins before the target stands here
    std::int64_t high = source_.size();
    while (high - low > closeEnough) {
        const std::int64_t middle = low + (high - low) / 2;
        const auto place = firstIn(middle, std::min(high, middle + largestFrame));
        if (place && place->frame.first <= target)
            low = place->offset;
        else
            high = middle;
    }
    return lastIn(low, high, target);
}

std::optional<FlacSearch::Place> FlacSearch::last() const {
    const std::int64_t size = source_.size();
    for (std::int64_t back = closeEnough; back <= 2 * largestFrame; back *= 2) {
        const std::int64_t begin = std::max(firstFrame_, size - back);
        if (const auto place = lastIn(begin, size, std::numeric_limits<std::int64_t>::max()))
            return place;
        if (begin == firstFrame_)
            break;
    }
    return std::nullopt;
}

} // namespace tarn
