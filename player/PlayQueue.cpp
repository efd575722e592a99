#include "player/PlayQueue.h"

#include <algorithm>
#include <cassert>
#include <iterator>
#include <utility>

namespace tarn {

std::shared_ptr<PlaybackItem> PlayQueue::current() const {
    return entries_.empty() ? nullptr : entries_.front().item;
}

std::int64_t PlayQueue::heard() const {
    if (pausedFrame_)
        return *pausedFrame_;
    return clock_ ? clock_->heardFrame() : 0;
}

std::chrono::nanoseconds PlayQueue::positionOf(const PlaybackItem& item) const {
    const Entry& entry = *byItem_.at(&item);
    if (entry.moved)
        return entry.position;
    return timeline_.positionOf(entry.id, heard()).value_or(entry.position);
}

bool PlayQueue::insert(std::shared_ptr<PlaybackItem> item, const PlaybackItem* after) {
    if (byItem_.contains(item.get()))
        return false;
    auto behind = byItem_.find(after);
    auto where = behind == byItem_.end() ? entries_.end() : std::next(behind->second);
    Entries added; // so that it is in both places or, when memory runs out, in neither
    auto entry = added.insert(added.end(), Entry{++lastId_, std::move(item), {}, false, nullptr});
    byItem_.emplace(entry->item.get(), entry);
    entries_.splice(where, added);
    enter(*entry);
    changed_();
    return true;
}

/// The item's position comes along, out of the queue that drove it before.
void PlayQueue::enter(Entry& entry) {
    PlaybackItem::State& state = entry.item->state();
    if (!std::exchange(state.playedToEnd, false))
        entry.position = state.driver ? state.driver->positionOf(*entry.item) : state.position;
    entry.driverBefore = std::exchange(state.driver, this);
}

/// The item's position stays with it when no other queue holds it.
void PlayQueue::leave(Entry& entry) {
    PlaybackItem::State& state = entry.item->state();
    if (state.driver == this)
        state.position = positionOf(*entry.item);
    PlayQueue** driver = &state.driver;
    while (*driver != this)
        driver = &(*driver)->byItem_.at(entry.item.get())->driverBefore;
    *driver = std::exchange(entry.driverBefore, nullptr);
}

PlayQueue::Entries PlayQueue::take(Entries::iterator entry) {
    leave(*entry);
    byItem_.erase(entry->item.get());
    Entries taken;
    taken.splice(taken.end(), entries_, entry);
    changed_();
    return taken;
}

PlayQueue::Entries PlayQueue::remove(const PlaybackItem& item) {
    auto found = byItem_.find(&item);
    return found == byItem_.end() ? Entries() : take(found->second);
}

PlayQueue::Entries PlayQueue::removeFirst() { return entries_.empty() ? Entries() : take(entries_.begin()); }

PlayQueue::Entries PlayQueue::removeAll() {
    Entries taken;
    while (!entries_.empty())
        taken.splice(taken.end(), take(entries_.begin()));
    return taken;
}

void PlayQueue::seek(const PlaybackItem& item, std::chrono::nanoseconds position) {
    Entry& entry = *byItem_.at(&item);
    entry.position = position;
    entry.moved = true;
    if (&entry == &entries_.front())
        ++seeks_;
    changed_();
}

bool PlayQueue::setRate(float rate) {
    staysPaused_ = rate == 0 && (staysPaused_ || interruptedRate_);
    interruptedRate_.reset();
    lostDevice_ = lostDevice_ && rate == 0;
    if (rate == rate_)
        return false;
    if (rate == 0)
        pausedFrame_ = heard();
    else
        pausedFrame_.reset();
    rate_ = rate;
    changed_();
    return true;
}

bool PlayQueue::play() {
    if (std::exchange(staysPaused_, false) || lostDevice_)
        return false;
    return setRate(interruptedRate_.value_or(1.0F));
}

bool PlayQueue::interrupt() {
    if (rate_ == 0)
        return false;
    float before = rate_;
    setRate(0);
    staysPaused_ = false;
    interruptedRate_ = before;
    return true;
}

bool PlayQueue::loseDevice() {
    if (rate_ == 0 && !interruptedRate_)
        return false;
    setRate(0);
    lostDevice_ = true;
    return true;
}

std::optional<PlayQueue::Rewind> PlayQueue::reconcile(std::int64_t firstReplaceable,
                                                      std::int64_t writeIndex) {
    if (const auto& spans = timeline_.spans(); !spans.empty() && spans.back().endFrame > writeIndex)
        timeline_.cut(writeIndex);
    std::optional<Rewind> rewind = dropDiverged(firstReplaceable);
    auto entry = entries_.begin();
    for (int reach = 0; reach < 2 && entry != entries_.end(); ++reach, ++entry)
        entry->moved = false; // what was rendered of it is gone, so head() begins at its position
    bool rateChanged = std::exchange(renderedRate_, rate_) != rate_;
    if (!rateChanged || timeline_.spans().empty())
        return rewind;
    timeline_.cut(firstReplaceable);
    return Rewind{firstReplaceable, Output::Join::blended};
}

/// Walks the queue along the timeline, up to the first entry that is not what is rendered there.
std::optional<PlayQueue::Rewind> PlayQueue::dropDiverged(std::int64_t firstReplaceable) {
    const auto& spans = timeline_.spans();
    if (spans.empty())
        return Rewind{firstReplaceable, Output::Join::blended};
    auto entry = entries_.begin();
    for (std::size_t index = 0; index < spans.size(); ++entry) {
        if (entry == entries_.end() || entry->id != spans[index].entry || entry->moved) {
            std::int64_t boundary = spans[index].firstFrame;
            timeline_.dropFrom(index);
            if (index == 0 || boundary < firstReplaceable)
                return Rewind{firstReplaceable, Output::Join::blended};
            return Rewind{boundary, Output::Join::cut};
        }
        while (index < spans.size() && spans[index].entry == entry->id)
            ++index;
    }
    return std::nullopt;
}

std::optional<PlayQueue::Head> PlayQueue::head() const {
    if (entries_.empty())
        return std::nullopt;
    auto entry = entries_.begin();
    if (timeline_.spans().empty())
        return Head{entry->id, entry->position, renderedRate_};
    const Timeline::Span& last = timeline_.spans().back();
    auto second = std::next(entry);
    if (last.entry != entry->id) {
        if (second == entries_.end() || last.entry != second->id || last.ending != Timeline::End::none)
            return std::nullopt;
        return Head{last.entry, last.end, renderedRate_};
    }
    if (last.ending == Timeline::End::none)
        return Head{last.entry, last.end, renderedRate_};
    bool stops = last.backwards && last.ending == Timeline::End::completed;
    if (stops || second == entries_.end())
        return std::nullopt;
    return Head{second->id, second->position, renderedRate_};
}

std::optional<std::int64_t> PlayQueue::nextEnd() const {
    const Timeline::Span* span = playing() ? timeline_.endOf(entries_.front().id) : nullptr;
    return span ? std::optional(span->endFrame) : std::nullopt;
}

std::optional<PlayQueue::Ending> PlayQueue::takeEnd() {
    if (!playing())
        return std::nullopt;
    std::int64_t now = heard();
    const Timeline::Span* span = timeline_.endOf(entries_.front().id);
    bool atStart = span && span->backwards && span->ending == Timeline::End::completed;
    bool turned = atStart && rate_ > 0;
    if (!span || span->endFrame > now || entries_.front().moved || turned) {
        timeline_.forgetBefore(now);
        return std::nullopt;
    }
    if (atStart) {
        setRate(0);
        Ending stop;
        stop.rateChanged = true;
        return stop;
    }
    return end(entries_.begin(), span->ending, span->error);
}

std::optional<PlayQueue::Ending> PlayQueue::fail(EntryId id, const Error& error) {
    auto entry = std::find_if(entries_.begin(), entries_.end(), [id](const Entry& e) { return e.id == id; });
    if (entry == entries_.end())
        return std::nullopt;
    return end(entry, Timeline::End::failed, error);
}

PlayQueue::Ending PlayQueue::end(Entries::iterator entry, Timeline::End how,
                                 const std::optional<Error>& error) {
    PlaybackItem::State& state = entry->item->state();
    Ending ending;
    ending.how = how;
    ending.driven = state.driver == this;
    ending.currentItemChanged = entry == entries_.begin();
    ending.left = take(entry);
    state.playedToEnd = ending.driven && !state.driver && how == Timeline::End::completed;
    if (how == Timeline::End::failed && state.status != MediaStatus::failed) {
        state.status = MediaStatus::failed;
        state.error = error ? std::make_unique<const Error>(*error) : nullptr;
        ending.statusChanged = true;
    }
    if (entries_.empty())
        ending.rateChanged = setRate(0);
    return ending;
}

} // namespace tarn
