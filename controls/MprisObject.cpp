#include "controls/MprisObject.h"

#include <utility>

#include <unistd.h>

#include "controls/MprisVtable.h"
#include "log/SystemLog.h"

namespace tarn {

namespace {

constexpr char mprisMethod[] = "MprisObject";
constexpr char busNamePrefix[] = "org.mpris.MediaPlayer2.";

} // namespace

MprisObject::MprisObject(RemoteTargets& targets, RemoteCommandThread& thread, std::string name)
    : commands_(targets, thread), wellKnownName_(busNamePrefix + std::move(name)) {}

MprisObject::~MprisObject() = default;

void MprisObject::show(MprisState state, bool alive) {
    const MprisChanges changes = changesBetween(state_, state);
    state_ = std::move(state);
    alive_ = alive;
    if (!alive_)
        disappear();
    else if (requestedName_.empty())
        appear();
    else
        signal(changes);
}

void MprisObject::busConnected(sd_bus& bus) {
    bus_ = &bus;
    if (alive_)
        appear();
}

void MprisObject::busLost() {
    commands_.forgetCallers();
    nameRequest_.reset();
    playerInterface_.reset();
    rootInterface_.reset();
    requestedName_.clear();
    bus_ = nullptr;
}

/// The object stands before its name is asked for: whoever sees the name reads the properties at once.
void MprisObject::appear() {
    if (!bus_)
        return;
    const auto add = [this](SlotHandle& interface, const char* name, const sd_bus_vtable* table) {
        sd_bus_slot* slot = nullptr;
        const int result = sd_bus_add_object_vtable(bus_, &slot, mprisPath, name, table, this);
        if (result < 0)
            SystemLog::error(mprisMethod, __LINE__,
                             "%{public}s:%d: Could not add %{public}s to the session bus: %d", name, result);
        interface.reset(slot);
    };
    add(rootInterface_, mprisRootInterface, mprisRootTable());
    add(playerInterface_, mprisPlayerInterface, mprisPlayerTable());
    requestName(wellKnownName_);
}

void MprisObject::requestName(std::string name) {
    requestedName_ = std::move(name);
    sd_bus_slot* slot = nullptr;
    sd_bus_request_name_async(bus_, &slot, requestedName_.c_str(), 0, handleNameReply, this);
    nameRequest_.reset(slot);
}

int MprisObject::handleNameReply(sd_bus_message* reply, void* object, sd_bus_error*) {
    auto& self = *static_cast<MprisObject*>(object);
    enum : std::uint32_t { primaryOwner = 1, exists = 3, alreadyOwner = 4 };
    std::uint32_t answer = 0;
    if (sd_bus_message_is_method_error(reply, nullptr) == 0 &&
        sd_bus_message_read(reply, "u", &answer) >= 0 && (answer == primaryOwner || answer == alreadyOwner))
        return 0;
    if (answer == exists && self.requestedName_ == self.wellKnownName_)
        self.requestName(self.wellKnownName_ + ".instance" + std::to_string(getpid()));
    else
        SystemLog::error(mprisMethod, __LINE__, "%{public}s:%d: The session bus refuses the name %{public}s.",
                         self.requestedName_);
    return 0;
}

void MprisObject::disappear() {
    if (requestedName_.empty())
        return;
    sd_bus_release_name_async(bus_, nullptr, requestedName_.c_str(), nullptr, nullptr);
    requestedName_.clear();
    nameRequest_.reset();
    playerInterface_.reset();
    rootInterface_.reset();
}

void MprisObject::signal(const MprisChanges& changes) {
    emit(mprisRootInterface, changes.application);
    emit(mprisPlayerInterface, changes.player);
    if (changes.seeked)
        sd_bus_emit_signal(bus_, mprisPath, mprisPlayerInterface, "Seeked", "x",
                           std::int64_t{changes.seeked->count()});
}

void MprisObject::emit(const char* interface, const std::vector<std::string>& properties) {
    if (properties.empty())
        return;
    std::vector<char*> names;
    names.reserve(properties.size() + 1);
    for (const std::string& property : properties)
        names.push_back(const_cast<char*>(property.c_str())); // the bus library only reads them
    names.push_back(nullptr);
    sd_bus_emit_properties_changed_strv(bus_, mprisPath, interface, names.data());
}

} // namespace tarn
