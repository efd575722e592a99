#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "roles/Error.h"
#include "roles/MediaMetadataItem.h"

namespace tarn {

/// What a simulated audio file is and does.
struct MediaScript {
    struct Stall {
        std::chrono::nanoseconds position;
        std::chrono::nanoseconds duration;
    };

    /// Tags that come before the next three; in a file anything may be a tag.
    std::vector<MediaMetadataItem> firstTags{};
    std::optional<std::string> title{};
    std::optional<std::string> albumTitle{};
    std::optional<std::string> artist{};

    std::chrono::nanoseconds duration = std::chrono::seconds(60);
    bool tellsDuration = true;

    /// Opens only while the right that this token gave is held.
    std::optional<std::string> token{};

    /// How long it takes to open an item, until it is ready to play.
    std::chrono::nanoseconds readyAfter{0};

    /// The asset opens, but its items cannot be played, as is known when they would be ready.
    std::optional<Error> unplayable{};

    /// Playing cannot get past this position.
    std::optional<std::chrono::nanoseconds> breaksAt{};
    Error breakError{"SimulatedMedia", 1, {{localizedDescriptionKey, "The file is broken."}}};

    /// Where nothing is at hand for a while, each time that an item gets there for the first time.
    std::vector<Stall> stalls{};
};

} // namespace tarn
