#pragma once

#include <array>
#include <chrono>
#include <functional>
#include <memory>
#include <optional>

#include "player/PlayQueue.h"
#include "player/Rendering.h"

namespace tarn {

/// The renderings that a player holds: the current item's and the next one's. Player thread.
class OpenRenderings {
public:
    /// `goesOn` is called on the player thread when a rendering that had nothing at hand has more.
    OpenRenderings(RenderingFactory& factory, std::function<void()> goesOn)
        : factory_(factory), goesOn_(std::move(goesOn)) {}

    bool has(EntryId entry) { return find(entry) != nullptr; }

    /// Returns why it cannot be rendered, if so. There is a place: keepOnly() has been called.
    std::optional<Error> open(EntryId entry, const std::shared_ptr<MediaAsset>& asset);

    /// How far open() has come with it.
    Opening opening(EntryId entry) { return find(entry)->rendering->opening(); }

    /// Closes what is neither of the two.
    void keepOnly(EntryId first, EntryId second);

    /// Renders what follows at `head`, whose entry is open, into the emptied `buffer`.
    RenderedSpan render(const PlayQueue::Head& head, const PcmFormat& format, PcmBuffer& buffer,
                        std::size_t maxFrames);

private:
    struct Open {
        EntryId entry = 0; ///< 0 is none
        std::unique_ptr<Rendering> rendering;
        std::chrono::nanoseconds position{-1}; ///< where render() goes on; below 0 before the first seek()
        float rate = 0;
        PcmFormat format;
    };

    Open* find(EntryId entry);

    RenderingFactory& factory_;
    const std::function<void()> goesOn_;
    std::array<Open, 2> open_;
};

} // namespace tarn
