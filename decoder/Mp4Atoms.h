#pragma once

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>

#include "decoder/ByteSource.h"

namespace tarn {

/// One of the nested pieces that an MP4 file is made of.
struct Mp4Atom {
    std::string type;
    std::int64_t begin = 0; ///< of its header
    std::int64_t payload = 0;
    std::int64_t end = 0;

    std::int64_t typeOffset() const { return begin + 4; }
};

/// Calls `visit` for the atoms in [begin, end) one after the other until it returns false; at most for a
/// thousand.
void visitAtoms(ByteSource& source, std::int64_t begin, std::int64_t end,
                const std::function<bool(const Mp4Atom&)>& visit);

/// The first atom on the way down `path`.
std::optional<Mp4Atom> findAtom(ByteSource& source, std::initializer_list<std::string_view> path,
                                const std::optional<Mp4Atom>& within = std::nullopt);

/// How long the media of a track are before an edit list takes its choice, in the track's own ticks.
std::optional<std::int64_t> mp4MediaDuration(ByteSource& source, std::int64_t track);

} // namespace tarn
