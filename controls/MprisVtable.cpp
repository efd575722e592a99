#include "controls/MprisVtable.h"

#include <algorithm>
#include <initializer_list>
#include <string>

#include "controls/MprisObject.h"

namespace tarn {

namespace {

MprisObject& objectOf(void* object) { return *static_cast<MprisObject*>(object); }

/// A property getter of the bus library from a function that appends one value of the state.
template <auto append>
int get(sd_bus*, const char*, const char*, const char*, sd_bus_message* reply, void* object, sd_bus_error*) {
    return append(reply, objectOf(object).state());
}

int appendString(sd_bus_message* reply, const std::string& text) {
    return sd_bus_message_append(reply, "s", text.c_str());
}

template <bool value>
int appendConstant(sd_bus_message* reply, const MprisState&) {
    return sd_bus_message_append(reply, "b", value ? 1 : 0);
}

int appendNoStrings(sd_bus_message* reply, const MprisState&) {
    return sd_bus_message_append(reply, "as", 0);
}

int appendIdentity(sd_bus_message* reply, const MprisState& state) {
    return appendString(reply, state.application.identity);
}

int appendDesktopEntry(sd_bus_message* reply, const MprisState& state) {
    return appendString(reply, state.application.desktopEntry);
}

int appendPlaybackStatus(sd_bus_message* reply, const MprisState& state) {
    switch (state.playbackStatus) {
    case PlaybackStatus::playing:
        return appendString(reply, "Playing");
    case PlaybackStatus::paused:
        return appendString(reply, "Paused");
    case PlaybackStatus::stopped:
        break;
    }
    return appendString(reply, "Stopped");
}

int appendRate(sd_bus_message* reply, const MprisState& state) {
    return sd_bus_message_append(reply, "d", state.rate);
}

int appendMinimumRate(sd_bus_message* reply, const MprisState& state) {
    return sd_bus_message_append(reply, "d", state.minimumRate());
}

int appendMaximumRate(sd_bus_message* reply, const MprisState& state) {
    return sd_bus_message_append(reply, "d", state.maximumRate());
}

int appendVolume(sd_bus_message* reply, const MprisState&) { return sd_bus_message_append(reply, "d", 1.0); }

int appendPosition(sd_bus_message* reply, const MprisState& state) {
    const auto player = state.player.lock();
    const auto position = player ? microsecondsOf(player->playback().position) : state.position;
    return sd_bus_message_append(reply, "x", std::int64_t{position.count()});
}

int appendCanGoNext(sd_bus_message* reply, const MprisState& state) {
    return sd_bus_message_append(reply, "b", state.canGoNext ? 1 : 0);
}

int appendHasTrack(sd_bus_message* reply, const MprisState& state) {
    return sd_bus_message_append(reply, "b", state.hasTrack() ? 1 : 0);
}

int appendTrack(sd_bus_message* reply, const MprisTrack& track) {
    int result = sd_bus_message_append(reply, "{sv}", "mpris:trackid", "o", track.path().c_str());
    if (result >= 0 && track.length)
        result =
            sd_bus_message_append(reply, "{sv}", "mpris:length", "x", std::int64_t{track.length->count()});
    if (result >= 0 && track.title)
        result = sd_bus_message_append(reply, "{sv}", "xesam:title", "s", track.title->c_str());
    if (result >= 0 && track.artist)
        result = sd_bus_message_append(reply, "{sv}", "xesam:artist", "as", 1, track.artist->c_str());
    if (result >= 0 && track.album)
        result = sd_bus_message_append(reply, "{sv}", "xesam:album", "s", track.album->c_str());
    return result;
}

int appendMetadata(sd_bus_message* reply, const MprisState& state) {
    int result = sd_bus_message_open_container(reply, 'a', "{sv}");
    if (result >= 0 && state.track)
        result = appendTrack(reply, *state.track);
    return result < 0 ? result : sd_bus_message_close_container(reply);
}

int setRate(sd_bus*, const char*, const char*, const char*, sd_bus_message* value, void* object,
            sd_bus_error* error) {
    double rate = 0;
    const int result = sd_bus_message_read(value, "d", &rate);
    return result < 0 ? result : objectOf(object).commands().setRate(objectOf(object).state(), rate, error);
}

template <RemoteCommandKind kind>
int press(sd_bus_message* message, void* object, sd_bus_error* error) {
    return objectOf(object).commands().press(kind, objectOf(object).state(), message, error);
}

template <auto method>
int move(sd_bus_message* message, void* object, sd_bus_error* error) {
    return (objectOf(object).commands().*method)(objectOf(object).state(), message, error);
}

int doNothing(sd_bus_message* message, void*, sd_bus_error*) {
    return sd_bus_reply_method_return(message, nullptr);
}

int refuseUri(sd_bus_message*, void*, sd_bus_error* error) {
    return sd_bus_error_set(error, SD_BUS_ERROR_NOT_SUPPORTED,
                            "This player is given its files by its own clients.");
}

constexpr std::uint64_t open = SD_BUS_VTABLE_UNPRIVILEGED;
constexpr std::uint64_t constant = SD_BUS_VTABLE_PROPERTY_CONST;
constexpr std::uint64_t signalled = SD_BUS_VTABLE_PROPERTY_EMITS_CHANGE;
constexpr std::uint64_t silent = 0; // EmitsChangedSignal is false

const sd_bus_vtable rootTable[] = {
    SD_BUS_VTABLE_START(0),
    SD_BUS_METHOD("Raise", "", "", doNothing, open),
    SD_BUS_METHOD("Quit", "", "", doNothing, open),
    SD_BUS_PROPERTY("CanRaise", "b", get<appendConstant<false>>, 0, constant),
    SD_BUS_PROPERTY("CanQuit", "b", get<appendConstant<false>>, 0, constant),
    SD_BUS_PROPERTY("HasTrackList", "b", get<appendConstant<false>>, 0, constant),
    SD_BUS_PROPERTY("Identity", "s", get<appendIdentity>, 0, signalled),
    SD_BUS_PROPERTY("DesktopEntry", "s", get<appendDesktopEntry>, 0, signalled),
    SD_BUS_PROPERTY("SupportedUriSchemes", "as", get<appendNoStrings>, 0, constant),
    SD_BUS_PROPERTY("SupportedMimeTypes", "as", get<appendNoStrings>, 0, constant),
    SD_BUS_VTABLE_END,
};

const sd_bus_vtable playerTable[] = {
    SD_BUS_VTABLE_START(0),
    SD_BUS_METHOD("Next", "", "", press<RemoteCommandKind::nextTrack>, open),
    SD_BUS_METHOD("Previous", "", "", doNothing, open),
    SD_BUS_METHOD("Pause", "", "", press<RemoteCommandKind::pause>, open),
    SD_BUS_METHOD("PlayPause", "", "", press<RemoteCommandKind::togglePlayPause>, open),
    SD_BUS_METHOD("Stop", "", "", press<RemoteCommandKind::pause>, open),
    SD_BUS_METHOD("Play", "", "", press<RemoteCommandKind::play>, open),
    SD_BUS_METHOD_WITH_NAMES("Seek", "x", SD_BUS_PARAM(Offset), "", , move<&MprisCommands::seek>, open),
    SD_BUS_METHOD_WITH_NAMES("SetPosition", "ox", SD_BUS_PARAM(TrackId) SD_BUS_PARAM(Position), "", ,
                             move<&MprisCommands::setPosition>, open),
    SD_BUS_METHOD_WITH_NAMES("OpenUri", "s", SD_BUS_PARAM(Uri), "", , refuseUri, open),
    SD_BUS_SIGNAL_WITH_NAMES("Seeked", "x", SD_BUS_PARAM(Position), 0),
    SD_BUS_PROPERTY("PlaybackStatus", "s", get<appendPlaybackStatus>, 0, signalled),
    SD_BUS_WRITABLE_PROPERTY("Rate", "d", get<appendRate>, setRate, 0, signalled | open),
    SD_BUS_PROPERTY("Metadata", "a{sv}", get<appendMetadata>, 0, signalled),
    SD_BUS_PROPERTY("Volume", "d", get<appendVolume>, 0, constant),
    SD_BUS_PROPERTY("Position", "x", get<appendPosition>, 0, silent),
    SD_BUS_PROPERTY("MinimumRate", "d", get<appendMinimumRate>, 0, signalled),
    SD_BUS_PROPERTY("MaximumRate", "d", get<appendMaximumRate>, 0, signalled),
    SD_BUS_PROPERTY("CanGoNext", "b", get<appendCanGoNext>, 0, signalled),
    SD_BUS_PROPERTY("CanGoPrevious", "b", get<appendConstant<false>>, 0, signalled),
    SD_BUS_PROPERTY("CanPlay", "b", get<appendHasTrack>, 0, signalled),
    SD_BUS_PROPERTY("CanPause", "b", get<appendHasTrack>, 0, signalled),
    SD_BUS_PROPERTY("CanSeek", "b", get<appendHasTrack>, 0, signalled),
    SD_BUS_PROPERTY("CanControl", "b", get<appendConstant<true>>, 0, silent),
    SD_BUS_VTABLE_END,
};

} // namespace

const sd_bus_vtable* mprisRootTable() { return rootTable; }
const sd_bus_vtable* mprisPlayerTable() { return playerTable; }

} // namespace tarn
