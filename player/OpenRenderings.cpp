#include "player/OpenRenderings.h"

#include <algorithm>
#include <cassert>
#include <utility>

namespace tarn {

OpenRenderings::Open* OpenRenderings::find(EntryId entry) {
    auto found =
        std::find_if(open_.begin(), open_.end(), [entry](const Open& open) { return open.entry == entry; });
    return found == open_.end() ? nullptr : &*found;
}

std::optional<Error> OpenRenderings::open(EntryId entry, const std::shared_ptr<MediaAsset>& asset) {
    Open* place = find(0);
    assert(place);
    RenderingFactory::Outcome outcome = factory_.open(asset, goesOn_);
    if (!outcome.rendering)
        return outcome.error.value_or(Error{});
    place->entry = entry;
    place->rendering = std::move(outcome.rendering);
    return std::nullopt;
}

void OpenRenderings::keepOnly(EntryId first, EntryId second) {
    for (Open& open : open_)
        if (open.entry != first && open.entry != second)
            open = {};
}

RenderedSpan OpenRenderings::render(const PlayQueue::Head& head, const PcmFormat& format, PcmBuffer& buffer,
                                    std::size_t maxFrames) {
    Open* open = find(head.entry);
    assert(open);
    if (open->position != head.position || open->rate != head.rate || open->format != format) {
        open->rendering->seek(head.position, head.rate, format);
        open->rate = head.rate;
        open->format = format;
    }
    buffer.clear();
    RenderedSpan span = open->rendering->render(buffer, maxFrames);
    open->position = span.end;
    return span;
}

} // namespace tarn
