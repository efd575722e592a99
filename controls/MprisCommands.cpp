#include "controls/MprisCommands.h"

#include <cmath>
#include <string>
#include <utility>

#include "roles/MediaAsset.h"
#include "roles/MediaItem.h"

namespace tarn {

namespace {

constexpr char noSuchContentError[] = "ostrel.tarnd.Error.NoSuchContent";
constexpr char commandFailedError[] = "ostrel.tarnd.Error.CommandFailed";
constexpr std::int32_t perSecond = 1'000'000;

int answerAtOnce(sd_bus_message* message) { return sd_bus_reply_method_return(message, nullptr); }

/// In seconds; infinite when the file does not tell.
double lengthOf(const MediaItem& item) {
    const MediaTime duration = item.asset()->duration();
    return duration.isNumeric() ? duration.seconds() : HUGE_VAL;
}

RemoteCommandResult moveTo(MediaItem& item, double seconds) {
    item.seekToTime(MediaTime::fromSeconds(seconds, perSecond));
    return RemoteCommandResult::success;
}

} // namespace

MprisCommands::Command MprisCommands::pressing(RemoteCommandKind kind) const {
    return [&targets = targets_, kind] { return targets.deliver(kind); };
}

int MprisCommands::press(RemoteCommandKind kind, const MprisState& state, sd_bus_message* message,
                         sd_bus_error* error) {
    if (!state.hasTrack()) {
        if (kind == RemoteCommandKind::togglePlayPause)
            return sd_bus_error_set(error, commandFailedError, "There is nothing to play.");
        // Pausing does no harm and may be urgent: it is passed on even if nothing is known to play.
        if (kind == RemoteCommandKind::pause)
            carryOutUnanswered(pressing(kind));
        return answerAtOnce(message);
    }
    if (kind == RemoteCommandKind::nextTrack && !state.canGoNext)
        return answerAtOnce(message);
    return carryOut(pressing(kind), message, error);
}

int MprisCommands::seek(const MprisState& state, sd_bus_message* message, sd_bus_error* error) {
    std::int64_t offset = 0;
    if (const int result = sd_bus_message_read(message, "x", &offset); result < 0)
        return result;
    auto player = state.player.lock();
    auto item = state.item.lock();
    if (!player || !item)
        return answerAtOnce(message);
    auto move = [player = std::move(player), item = std::move(item), offset,
                 next = pressing(RemoteCommandKind::nextTrack)] {
        const PlaybackState playback = player->playback();
        if (playback.item != item) // it was over before the command's turn came
            return RemoteCommandResult::success;
        const double target = playback.position.seconds() + static_cast<double>(offset) / perSecond;
        return playback.hasNextItem && target > lengthOf(*item) ? next() : moveTo(*item, target);
    };
    return carryOut(std::move(move), message, error);
}

int MprisCommands::setPosition(const MprisState& state, sd_bus_message* message, sd_bus_error* error) {
    const char* track = nullptr;
    std::int64_t position = 0;
    if (const int result = sd_bus_message_read(message, "ox", &track, &position); result < 0)
        return result;
    const double target = static_cast<double>(position) / perSecond;
    auto item = state.item.lock();
    if (!item || track != state.track->path() || target < 0 || target > lengthOf(*item))
        return answerAtOnce(message);
    return carryOut([item = std::move(item), target] { return moveTo(*item, target); }, message, error);
}

int MprisCommands::setRate(const MprisState& state, double rate, sd_bus_error* error) {
    if (rate == 0.0) {
        carryOutUnanswered(pressing(RemoteCommandKind::pause));
        return 0;
    }
    auto player = state.player.lock();
    if (!player || state.playbackStatus != PlaybackStatus::playing)
        return sd_bus_error_set(error, commandFailedError, "Nothing plays: Play begins at the rate 1.");
    if (!(rate >= state.minimumRate() && rate <= state.maximumRate()))
        return sd_bus_error_set(error, SD_BUS_ERROR_INVALID_ARGS, "Nothing is heard at this rate.");
    carryOutUnanswered([player = std::move(player), rate] {
        const bool done = player->setRate(static_cast<float>(rate));
        return done ? RemoteCommandResult::success : RemoteCommandResult::commandFailed;
    });
    return 0;
}

int MprisCommands::carryOut(Command command, sd_bus_message* message, sd_bus_error* error) {
    const std::uint64_t call = ++lastCall_;
    if (!thread_.deliver(std::move(command),
                         [this, call](RemoteCommandResult result) { answer(call, result); }))
        return sd_bus_error_set(error, SD_BUS_ERROR_LIMITS_EXCEEDED, "Too many commands are waiting.");
    unanswered_.emplace(call, sd_bus_message_ref(message));
    return 1;
}

/// With too many commands waiting it is let go: nobody would be told.
void MprisCommands::carryOutUnanswered(Command command) {
    static_cast<void>(thread_.deliver(std::move(command), nullptr));
}

void MprisCommands::answer(std::uint64_t call, RemoteCommandResult result) {
    const auto found = unanswered_.find(call);
    if (found == unanswered_.end())
        return; // its connection was lost
    const MessageHandle message = std::move(found->second);
    unanswered_.erase(found);
    switch (result) {
    case RemoteCommandResult::success:
        answerAtOnce(message.get());
        break;
    case RemoteCommandResult::noSuchContent:
        sd_bus_reply_method_errorf(message.get(), noSuchContentError, "There is nothing more to play.");
        break;
    case RemoteCommandResult::commandFailed:
        sd_bus_reply_method_errorf(message.get(), commandFailedError, "The player could not do that.");
        break;
    }
}

} // namespace tarn
