#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "controls/BusConnection.h"
#include "controls/BusHandles.h"
#include "controls/MprisState.h"
#include "controls/RemoteCommandThread.h"

namespace tarn {

/// The media player that the session bus sees: hands out the state, signals its changes, and passes commands
/// on to the thread that delivers them. On the bus thread.
///
/// Properties are answered from the state at hand. A command is answered when its handler has; until then
/// only its message is kept.
class MprisObject final : public BusConnectionClient {
public:
    /// `name` is the last element of the bus name.
    MprisObject(RemoteCommandThread& commands, std::string name);
    ~MprisObject() override;

    const MprisState& state() const { return state_; }

    /// Shows `state`, telling the listeners what has changed. The player is on the bus only while `alive`.
    void show(MprisState state, bool alive);

    void busConnected(sd_bus& bus) override;
    void busLost() override;

    /// A command came by `message`, which is answered later. Returns below 0 for an answer in `error`
    /// instead.
    int command(sd_bus_message* message, RemoteCommandKind kind, sd_bus_error* error);

    /// A listener set the rate: 0 pauses, 1 plays on at the normal rate if something plays at another one.
    /// There is no command for any other rate: it is ignored.
    void rateSet(double rate);

private:
    static int handleNameReply(sd_bus_message* reply, void* object, sd_bus_error* error);

    void appear();
    void disappear();
    void requestName(std::string name);
    void signal(const MprisChanges& changes);
    void emit(const char* interface, const std::vector<std::string>& properties);
    void answer(std::uint64_t command, RemoteCommandResult result);

    RemoteCommandThread& commands_;
    const std::string wellKnownName_;
    MprisState state_;
    bool alive_ = false;

    sd_bus* bus_ = nullptr; // null while there is no connection
    SlotHandle rootInterface_;
    SlotHandle playerInterface_;
    SlotHandle nameRequest_;
    std::string requestedName_; // empty while the player is not on the bus

    std::map<std::uint64_t, MessageHandle> unanswered_;
    std::uint64_t lastCommand_ = 0;
};

} // namespace tarn
