#pragma once

#include <string>
#include <vector>

#include "controls/BusConnection.h"
#include "controls/BusHandles.h"
#include "controls/MprisCommands.h"
#include "controls/MprisState.h"

namespace tarn {

/// The media player that the session bus sees: its name, its properties and their signals. On the bus thread.
///
/// Properties are answered from the state that was shown last; only the position is asked for anew.
class MprisObject final : public BusConnectionClient {
public:
    /// `name` is the last element of the bus name.
    MprisObject(RemoteTargets& targets, RemoteCommandThread& thread, std::string name);
    ~MprisObject() override;

    const MprisState& state() const { return state_; }
    MprisCommands& commands() { return commands_; }

    /// Shows `state`, telling the listeners what has changed. The player is on the bus only while `alive`.
    void show(MprisState state, bool alive);

    void busConnected(sd_bus& bus) override;
    void busLost() override;

private:
    static int handleNameReply(sd_bus_message* reply, void* object, sd_bus_error* error);

    void appear();
    void disappear();
    void requestName(std::string name);
    void signal(const MprisChanges& changes);
    void emit(const char* interface, const std::vector<std::string>& properties);

    MprisCommands commands_;
    const std::string wellKnownName_;
    MprisState state_;
    bool alive_ = false;

    sd_bus* bus_ = nullptr; // null while there is no connection
    SlotHandle rootInterface_;
    SlotHandle playerInterface_;
    SlotHandle nameRequest_;
    std::string requestedName_; // empty while the player is not on the bus
};

} // namespace tarn
