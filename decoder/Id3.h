#pragma once

#include <cstdint>
#include <optional>

#include "decoder/ByteSource.h"

namespace tarn {

/// An ID3v2 tag in front of a file.
struct Id3Tag {
    int version = 0; ///< 2, 3 or 4
    bool extended = false;
    std::int64_t begin = 0; ///< of its header
    std::int64_t end = 0;   ///< of its frames and padding

    std::int64_t next = 0; ///< what follows it

    /// The tag at `offset`.
    static std::optional<Id3Tag> at(ByteSource& source, std::int64_t offset);
};

/// Where the tags end that a file begins with; there may be several, or none.
std::int64_t endOfId3Tags(ByteSource& source);

} // namespace tarn
