#include "client/tool/play/TrackQueue.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <system_error>
#include <utility>

namespace tarn::tool {

namespace {

/// Tracks that the service knows behind the one that plays. While the tool is stopped, these go on playing.
constexpr std::size_t mostAhead = 16;

/// Tracks that it keeps knowing before it: news of the last one may still come.
constexpr std::size_t mostBehind = 1;

/// Names of their own, so that another program's objects are never taken for these.
std::string identifierOf(std::size_t number) {
    return std::to_string(::getpid()) + "-" + std::to_string(number);
}

constexpr auto ignoreOutcome = [](const client::Completion&) {};

} // namespace

std::string Track::title() const {
    return info.title && !info.title->empty() ? *info.title : std::filesystem::path(path).filename().string();
}

TrackQueue::TrackQueue(client::Client& client, std::string player, std::vector<std::string> files,
                       PlayOrder::Options order, Access access, Listener listener)
    : client_(client),
      player_(std::move(player)),
      files_(std::move(files)),
      order_(files_.size(), order),
      access_(access),
      listener_(std::move(listener)) {}

void TrackQueue::fill() {
    const std::size_t wanted = hasBegun_ ? reached_ + mostAhead : 1;
    while (tracks_.size() < wanted && openNext()) {
    }
}

bool TrackQueue::openNext() {
    const auto turn = order_.next();
    isExhausted_ = !turn;
    if (!turn)
        return false;
    const Track track{files_[turn->file], identifierOf(++opened_), turn->file, turn->number, {}};
    client::AssetUpsert upsert{.identifier = track.identifier, .URL = client::fileURL(track.path)};
    try {
        if (access_ == Access::granted)
            upsert.sandboxExtensionToken = client_.grantFile(track.path);
    } catch (const std::system_error& problem) {
        order_.leaveOut(track.file);
        listener_.refused(track.path, problem.code().message());
        return true;
    }
    tracks_.push_back({track});
    client_.upsertAsset(
        upsert, [this, identifier = track.identifier](const auto& result) { takeAsset(identifier, result); });
    return true;
}

void TrackQueue::takeAsset(const std::string& identifier, const client::Result<client::AssetInfo>& result) {
    const auto entry = find(identifier);
    if (entry == tracks_.end() || result.outcome == client::Outcome::connectionLost ||
        result.outcome == client::Outcome::takenOver)
        return;
    if (result.outcome != client::Outcome::answered)
        return refuse(entry, result.succeeded() ? "the service gave no answer" : result.problem());
    entry->track.info = result.value;
    client_.upsertItem(identifier, identifier,
                       [this, identifier](const auto& made) { takeItem(identifier, made); });
}

void TrackQueue::takeItem(const std::string& identifier, const client::Completion& result) {
    const auto entry = find(identifier);
    if (entry == tracks_.end() || result.outcome == client::Outcome::connectionLost ||
        result.outcome == client::Outcome::takenOver)
        return;
    if (!result.succeeded())
        return refuse(entry, result.problem());
    entry->isItem = true;
    queueWhatIsReady();
}

void TrackQueue::refuse(Entries::iterator entry, const std::string& reason) {
    order_.leaveOut(entry->track.file);
    const auto path = entry->track.path;
    tracks_.erase(entry);
    fill();
    queueWhatIsReady();
    listener_.refused(path, reason);
}

void TrackQueue::queueWhatIsReady() {
    for (; inQueue_ < tracks_.size() && tracks_[inQueue_].isItem; ++inQueue_) {
        const auto& item = tracks_[inQueue_].track.identifier;
        if (!hasPlayer_)
            makePlayer(item);
        else
            client_.appendItem(player_, item, ignoreOutcome);
    }
    skipWhatIsQueued();
}

void TrackQueue::makePlayer(const std::string& item) {
    hasPlayer_ = true;
    client_.upsertQueuePlayer(player_, {item}, [this](const client::Result<client::Status>& made) {
        if (made.outcome == client::Outcome::answered) {
            listener_.begins();
            hasBegun_ = true;
            fill();
        } else if (made.outcome != client::Outcome::connectionLost &&
                   made.outcome != client::Outcome::takenOver) {
            listener_.failed(made.problem());
        }
    });
}

std::optional<Track> TrackQueue::goOnTo(const std::optional<std::string>& item) {
    const auto entry = item ? find(*item) : tracks_.end();
    if (entry == tracks_.end())
        return std::nullopt;
    const auto track = entry->track;
    const auto index = static_cast<std::size_t>(entry - tracks_.begin());
    reached_ = std::max(reached_, index + 1);
    forgetBehind(index);
    if (hasBegun_)
        fill();
    return track;
}

void TrackQueue::skip() {
    ++skips_;
    skipWhatIsQueued();
}

void TrackQueue::skipWhatIsQueued() {
    for (; skips_ > 0 && (reached_ < inQueue_ || isAtEnd()); --skips_) {
        client_.advanceToNextItem(player_, ignoreOutcome);
        reached_ = std::min(reached_ + 1, inQueue_);
    }
    fill();
}

void TrackQueue::forgetBehind(std::size_t index) {
    for (; index > mostBehind; --index) {
        const auto& old = tracks_.front().track.identifier;
        client_.destroyItem(old, ignoreOutcome);
        client_.destroyAsset(old, ignoreOutcome);
        tracks_.pop_front();
        --inQueue_;
        --reached_;
    }
}

const std::string* TrackQueue::pathOf(const std::string& item) const {
    const auto found = std::find_if(tracks_.begin(), tracks_.end(),
                                    [&](const Entry& entry) { return entry.track.identifier == item; });
    return found == tracks_.end() ? nullptr : &found->track.path;
}

void TrackQueue::leaveOut(const std::string& item) {
    if (const auto entry = find(item); entry != tracks_.end())
        order_.leaveOut(entry->track.file);
}

TrackQueue::Entries::iterator TrackQueue::find(const std::string& identifier) {
    return std::find_if(tracks_.begin(), tracks_.end(),
                        [&](const Entry& entry) { return entry.track.identifier == identifier; });
}

} // namespace tarn::tool
