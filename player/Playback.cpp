#include "player/Playback.h"

#include <array>
#include <cassert>
#include <iterator>
#include <utility>

#include "player/EventLoop.h"
#include "roles/MediaAsset.h"

namespace tarn {

namespace {

/// Pieces of an eighth of a second: long enough to be decoded well, short enough to be waited for.
std::size_t pieceFrames(const PcmFormat& format) { return format.rate / 8; }

std::string firstText(const MediaAsset& asset, std::string_view key) {
    auto found = MediaMetadataItem::metadataItemsFromArray(asset.commonMetadata(), key,
                                                           MediaMetadataItem::commonKeySpace);
    return found.empty() ? std::string() : found.front().stringValue().value_or(std::string());
}

} // namespace

Playback::Playback(PlayerEnvironment& environment)
    : environment_(environment),
      queue_([this] {
          queueChanged_ = true;
          schedule();
      }),
      renderings_(environment.renderings, [this] { scheduleLocking(); }),
      timer_(environment.loop, [this] { scheduleLocking(); }) {}

void Playback::close() {
    PlayQueue::Entries left; // outlives the lock
    EngineLock lock(environment_);
    closed_ = true;
    left = queue_.removeAll();
    schedule();
}

void Playback::schedule() {
    if (!std::exchange(scheduled_, true))
        environment_.afterwards.emplace_back(
            [self = shared_from_this()] { self->environment_.loop.post([self] { self->run(); }); });
}

void Playback::scheduleLocking() {
    EngineLock lock(environment_);
    schedule();
}

void Playback::run() {
    assert(environment_.loop.isCurrent());
    bool closed = false;
    {
        EngineLock lock(environment_);
        scheduled_ = false;
        closed = closed_;
    }
    if (closed)
        return shutDown();
    reportEnds();
    if (!openPlace(0))
        return scheduleLocking();
    bool more = false;
    if (!prepareOutput()) {
        stopOutput();
    } else if (!sounding_ && output_->writeIndex() > output_->heardFrame()) {
        startOutput(); // what is there sounds before more is rendered
        more = true;
    } else {
        more = renderPiece();
        startOutput();
    }
    setTimer();
    tellOfChange();
    if (more || !openPlace(1))
        scheduleLocking();
}

void Playback::shutDown() {
    timer_.cancel();
    {
        EngineLock lock(environment_);
        queue_.setClock(nullptr);
    }
    output_.reset();
    renderings_.keepOnly(0, 0);
}

void Playback::outputDeviceVanished(const Error& error) {
    if (auto listener = listener_.lock())
        listener->deviceVanished(error);
}

void Playback::outputSoundChanged(const std::optional<Error>& error) {
    if (auto listener = listener_.lock())
        listener->soundChanged(error);
}

/// One after the other, so that whoever is told of an end finds the player as that end has left it.
void Playback::reportEnds() {
    while (true) {
        std::optional<PlayQueue::Ending> ending;
        {
            EngineLock lock(environment_);
            ending = queue_.takeEnd();
        }
        if (!ending)
            return;
        report(*ending);
    }
}

void Playback::report(const PlayQueue::Ending& ending) {
    for (const PlayQueue::Entry& entry : ending.left) {
        if (ending.statusChanged)
            entry.item->reportStatus();
        if (ending.driven)
            entry.item->post(ending.how == Timeline::End::failed ? MediaItem::failedToPlayToEndTime
                                                                 : MediaItem::didPlayToEndTime);
    }
    auto listener = listener_.lock();
    if (listener && ending.currentItemChanged)
        listener->currentItemChanged();
    if (listener && ending.rateChanged)
        listener->rateChanged();
}

/// The current item and the next one.
std::array<Playback::Place, 2> Playback::places() {
    std::array<Place, 2> places;
    EngineLock lock(environment_);
    auto place = places.begin();
    for (auto entry = queue_.entries().begin(); entry != queue_.entries().end() && place != places.end();
         ++entry)
        *place++ = {entry->id, entry->item};
    return places;
}

/// False when the item had to leave the queue: then everything is to be looked at anew.
bool Playback::openPlace(std::size_t index) {
    auto both = places();
    renderings_.keepOnly(both[0].entry, both[1].entry);
    const Place& place = both.at(index);
    if (!place.item)
        return true;
    const auto error = open(place);
    if (!error)
        return true;
    std::optional<PlayQueue::Ending> ending;
    {
        EngineLock lock(environment_);
        ending = queue_.fail(place.entry, *error);
    }
    if (ending)
        report(*ending);
    return false;
}

/// The item is ready as soon as it is open, which may be later. Returns why it cannot be played, if so.
std::optional<Error> Playback::open(const Place& place) {
    if (!renderings_.has(place.entry)) {
        auto error = place.item->error();
        if (!error)
            error = renderings_.open(place.entry, place.item->asset());
        if (error)
            return error;
        if (!output_)
            environment_.outputs.prepare();
    }
    Opening opening = renderings_.opening(place.entry);
    if (opening.done && !opening.error)
        place.item->becomeReady();
    return std::move(opening.error);
}

/// What sounds is again what is to be heard; false when nothing is to sound.
bool Playback::prepareOutput() {
    if (!output_) {
        {
            EngineLock lock(environment_);
            if (!queue_.playing())
                return false;
        }
        output_ = environment_.outputs.create(*this);
        EngineLock lock(environment_);
        queue_.setClock(output_.get());
    }
    EngineLock lock(environment_);
    if (!queue_.playing())
        return false;
    auto rewind = queue_.reconcile(output_->firstReplaceable(), output_->writeIndex());
    if (rewind && rewind->frame < output_->writeIndex())
        output_->rewind(rewind->frame, rewind->join);
    return true;
}

/// Renders a piece if there is room for it. True when there is more to do at once.
bool Playback::renderPiece() {
    std::size_t frames = pieceFrames(output_->format());
    if (output_->writable() < frames)
        return false;
    std::optional<PlayQueue::Head> head;
    {
        EngineLock lock(environment_);
        head = queue_.head();
    }
    if (!head)
        return false;
    if (!renderings_.has(head->entry)) {
        openPlace(1);
        return true;
    }
    RenderedSpan span = renderings_.render(*head, output_->format(), buffer_, frames);
    bool more = span.state != RenderedSpan::State::waiting;
    append(*head, std::move(span));
    if (buffer_.frames > 0)
        output_->write(buffer_);
    return more;
}

void Playback::append(const PlayQueue::Head& head, RenderedSpan span) {
    auto ending = Timeline::End::none;
    if (span.state == RenderedSpan::State::ended)
        ending = Timeline::End::completed;
    if (span.state == RenderedSpan::State::failed)
        ending = Timeline::End::failed;
    std::int64_t first = output_->writeIndex();
    EngineLock lock(environment_);
    queue_.append({.entry = head.entry,
                   .firstFrame = first,
                   .endFrame = first + static_cast<std::int64_t>(span.frames),
                   .start = span.start,
                   .end = span.end,
                   .backwards = head.rate < 0,
                   .ending = ending,
                   .error = std::move(span.error)});
}

void Playback::startOutput() {
    if (!std::exchange(sounding_, true))
        output_->start();
    if (auto place = places()[0]; place.item && std::exchange(described_, place.entry) != place.entry) {
        const MediaAsset& asset = *place.item->asset();
        output_->setDescription(firstText(asset, MediaMetadataItem::commonKeyTitle),
                                firstText(asset, MediaMetadataItem::commonKeyArtist));
    }
}

void Playback::stopOutput() {
    if (std::exchange(sounding_, false))
        output_->stop();
}

void Playback::setTimer() {
    std::optional<std::int64_t> end;
    {
        EngineLock lock(environment_);
        end = queue_.nextEnd();
    }
    if (end)
        timer_.set(*output_, *end);
    else
        timer_.cancel();
}

void Playback::tellOfChange() {
    {
        EngineLock lock(environment_);
        if (!std::exchange(queueChanged_, false))
            return;
    }
    if (auto listener = listener_.lock())
        listener->playbackChanged();
}

} // namespace tarn
