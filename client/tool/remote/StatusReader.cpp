#include "client/tool/remote/StatusReader.h"

#include <cstdint>
#include <string_view>

#include "client/tool/remote/Bus.h"

namespace tarn::tool {

namespace {

/// Takes the variant at the front: what it holds, or `fallback` when that is of another type.
template <class Value>
Value take(sd_bus_message* message, const char* type, Value fallback) {
    if (sd_bus_message_verify_type(message, 'v', type) > 0)
        requireBus(sd_bus_message_read(message, "v", type, &fallback));
    else
        requireBus(sd_bus_message_skip(message, "v"));
    return fallback;
}

double takeNumber(sd_bus_message* message, double fallback) { return take(message, "d", fallback); }

bool takeFlag(sd_bus_message* message) { return take(message, "b", 0) != 0; }

double takeSeconds(sd_bus_message* message) {
    return static_cast<double>(take(message, "x", std::int64_t{0})) / 1e6;
}

std::string takeText(sd_bus_message* message, const char* type = "s") { return take(message, type, ""); }

/// The first of a list of texts.
std::string takeFirstText(sd_bus_message* message) {
    if (sd_bus_message_verify_type(message, 'v', "as") <= 0) {
        requireBus(sd_bus_message_skip(message, "v"));
        return "";
    }
    requireBus(sd_bus_message_enter_container(message, 'v', "as"));
    requireBus(sd_bus_message_enter_container(message, 'a', "s"));
    const char* text = nullptr;
    std::string first = sd_bus_message_read(message, "s", &text) > 0 ? text : "";
    while (sd_bus_message_skip(message, "s") > 0) {
    }
    requireBus(sd_bus_message_exit_container(message));
    requireBus(sd_bus_message_exit_container(message));
    return first;
}

/// Calls `takeValue(key)` for each entry of a dictionary, which takes the value.
template <class TakeValue>
void readDictionary(sd_bus_message* message, TakeValue takeValue) {
    requireBus(sd_bus_message_enter_container(message, 'a', "{sv}"));
    while (sd_bus_message_enter_container(message, 'e', "sv") > 0) {
        const char* key = nullptr;
        requireBus(sd_bus_message_read(message, "s", &key));
        takeValue(std::string_view(key));
        requireBus(sd_bus_message_exit_container(message));
    }
    requireBus(sd_bus_message_exit_container(message));
}

void takeMetadata(sd_bus_message* message, PlayerStatus& status) {
    requireBus(sd_bus_message_enter_container(message, 'v', "a{sv}"));
    readDictionary(message, [&](std::string_view key) {
        if (key == "mpris:trackid")
            status.trackPath = takeText(message, "o");
        else if (key == "mpris:length")
            status.duration = takeSeconds(message);
        else if (key == "xesam:title")
            status.title = takeText(message);
        else if (key == "xesam:artist")
            status.artist = takeFirstText(message);
        else if (key == "xesam:album")
            status.album = takeText(message);
        else
            requireBus(sd_bus_message_skip(message, "v"));
    });
    requireBus(sd_bus_message_exit_container(message));
}

PlayerStatus::State stateNamed(std::string_view word) {
    return word == "Playing"  ? PlayerStatus::State::playing
           : word == "Paused" ? PlayerStatus::State::paused
                              : PlayerStatus::State::stopped;
}

} // namespace

PlayerStatus readStatus(sd_bus_message* message) {
    PlayerStatus status;
    readDictionary(message, [&](std::string_view key) {
        if (key == "PlaybackStatus")
            status.state = stateNamed(takeText(message));
        else if (key == "Metadata")
            takeMetadata(message, status);
        else if (key == "Position")
            status.position = takeSeconds(message);
        else if (key == "Rate")
            status.rate = takeNumber(message, 1);
        else if (key == "MinimumRate")
            status.slowestRate = takeNumber(message, 1);
        else if (key == "MaximumRate")
            status.fastestRate = takeNumber(message, 1);
        else if (key == "Volume")
            status.volume = takeNumber(message, 0);
        else if (key == "CanSeek")
            status.canSeek = takeFlag(message);
        else if (key == "CanGoNext")
            status.canGoNext = takeFlag(message);
        else
            requireBus(sd_bus_message_skip(message, "v"));
    });
    return status;
}

std::string readText(sd_bus_message* message) { return takeText(message); }

} // namespace tarn::tool
