#include "bench/controls/BusClient.h"

#include <cstring>
#include <stdexcept>

namespace tarn {

namespace {

constexpr char playerInterface[] = "org.mpris.MediaPlayer2.Player";
constexpr char propertiesInterface[] = "org.freedesktop.DBus.Properties";

void require(int result) {
    if (result < 0)
        throw std::runtime_error(std::strerror(-result));
}

} // namespace

BusClient::BusClient(const std::string& address) {
    require(sd_bus_new(&bus_));
    require(sd_bus_set_address(bus_, address.c_str()));
    require(sd_bus_set_bus_client(bus_, 1));
    require(sd_bus_start(bus_));
}

BusClient::~BusClient() { sd_bus_close_unref(bus_); }

BusClient::Microseconds BusClient::pingPlayer() { return call("org.freedesktop.DBus.Peer", "Ping", {}); }

BusClient::Microseconds BusClient::readPosition() {
    return call(propertiesInterface, "Get", {playerInterface, "Position"});
}

BusClient::Microseconds BusClient::readAllOfPlayer() {
    return call(propertiesInterface, "GetAll", {playerInterface});
}

BusClient::Microseconds BusClient::call(const char* interface, const char* method,
                                        const std::vector<const char*>& arguments) {
    sd_bus_message* message = nullptr;
    sd_bus_message* reply = nullptr;
    require(sd_bus_message_new_method_call(bus_, &message, "org.mpris.MediaPlayer2.tarnd",
                                           "/org/mpris/MediaPlayer2", interface, method));
    for (const char* argument : arguments)
        require(sd_bus_message_append(message, "s", argument));
    const auto begin = std::chrono::steady_clock::now();
    require(sd_bus_call(bus_, message, 0, nullptr, &reply));
    const Microseconds taken = std::chrono::steady_clock::now() - begin;
    sd_bus_message_unref(reply);
    sd_bus_message_unref(message);
    return taken;
}

} // namespace tarn
