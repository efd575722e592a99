#pragma once

#include <cstdint>
#include <functional>
#include <map>

#include "controls/BusHandles.h"
#include "controls/MprisState.h"
#include "controls/RemoteCommandThread.h"
#include "controls/RemoteTargets.h"

namespace tarn {

/// What programs on the session bus ask the player to do. On the bus thread.
///
/// A call is carried out on the thread of the remote commands and answered when that is done; until then only
/// its message is kept. Functions that take a message see to its answer, or return below 0 for the answer in
/// `error`. `state` is what the player showed when the call came.
class MprisCommands {
public:
    MprisCommands(RemoteTargets& targets, RemoteCommandThread& thread) : targets_(targets), thread_(thread) {}

    int press(RemoteCommandKind kind, const MprisState& state, sd_bus_message* message, sd_bus_error* error);

    /// Seek: moves by an offset. Beyond the end it is a Next, if there is a next track.
    int seek(const MprisState& state, sd_bus_message* message, sd_bus_error* error);

    /// SetPosition: moves within the track that is named. It does nothing when that is over, or beyond its
    /// end.
    int setPosition(const MprisState& state, sd_bus_message* message, sd_bus_error* error);

    /// The rate of what plays; 0 pauses. Returns below 0, with the reason in `error`, for a rate at which
    /// nothing would be heard, and while nothing plays.
    int setRate(const MprisState& state, double rate, sd_bus_error* error);

    /// The connection is gone, and with it everybody who waits for an answer.
    void forgetCallers() { unanswered_.clear(); }

private:
    using Command = RemoteCommandThread::Command;

    int carryOut(Command command, sd_bus_message* message, sd_bus_error* error);
    void carryOutUnanswered(Command command);
    void answer(std::uint64_t call, RemoteCommandResult result);

    Command pressing(RemoteCommandKind kind) const;

    RemoteTargets& targets_;
    RemoteCommandThread& thread_;
    std::map<std::uint64_t, MessageHandle> unanswered_;
    std::uint64_t lastCall_ = 0;
};

} // namespace tarn
