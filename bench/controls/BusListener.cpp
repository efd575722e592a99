#include "bench/controls/BusListener.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace tarn {

namespace {

constexpr char path[] = "/org/mpris/MediaPlayer2";
constexpr char rootInterface[] = "org.mpris.MediaPlayer2";
constexpr char playerInterface[] = "org.mpris.MediaPlayer2.Player";
constexpr char propertiesInterface[] = "org.freedesktop.DBus.Properties";

void require(int result, const char* what) {
    if (result < 0)
        throw std::runtime_error(std::string(what) + ": " + std::strerror(-result));
}

std::string changedProperties(sd_bus_message* message) {
    const char* interface = nullptr;
    require(sd_bus_message_read(message, "s", &interface), "interface");
    std::string line = std::strcmp(interface, playerInterface) == 0 ? "Player:" : "Root:";
    require(sd_bus_message_enter_container(message, 'a', "{sv}"), "changed properties");
    while (sd_bus_message_enter_container(message, 'e', "sv") > 0) {
        const char* property = nullptr;
        require(sd_bus_message_read(message, "s", &property), "property");
        require(sd_bus_message_skip(message, "v"), "value");
        require(sd_bus_message_exit_container(message), "entry");
        line += std::string(" ") + property;
    }
    require(sd_bus_message_exit_container(message), "changed properties");
    char** invalidated = nullptr;
    require(sd_bus_message_read_strv(message, &invalidated), "invalidated properties");
    for (char** property = invalidated; property && *property; ++property) {
        line += std::string(" !") + *property;
        free(*property);
    }
    free(invalidated);
    return line;
}

std::string ownerChange(sd_bus_message* message) {
    const char* name = nullptr;
    const char* before = nullptr;
    const char* after = nullptr;
    require(sd_bus_message_read(message, "sss", &name, &before, &after), "owner");
    return *after ? "appeared" : "vanished";
}

} // namespace

BusListener::BusListener(const std::string& address, std::string name) : name_(std::move(name)) {
    require(sd_bus_new(&bus_), "sd_bus_new");
    require(sd_bus_set_address(bus_, address.c_str()), "address");
    require(sd_bus_set_bus_client(bus_, 1), "client");
    require(sd_bus_start(bus_), "connect");
    const std::string signals = std::string("type='signal',path='") + path + "'";
    const std::string owner =
        "type='signal',sender='org.freedesktop.DBus',member='NameOwnerChanged',arg0='" + name_ + "'";
    require(sd_bus_add_match(bus_, nullptr, signals.c_str(), hear, this), "match");
    require(sd_bus_add_match(bus_, nullptr, owner.c_str(), hear, this), "match");
}

BusListener::~BusListener() { sd_bus_close_unref(bus_); }

int BusListener::hear(sd_bus_message* message, void* listener, sd_bus_error*) {
    auto& heard = static_cast<BusListener*>(listener)->heard_;
    if (sd_bus_message_is_signal(message, propertiesInterface, "PropertiesChanged") > 0)
        heard.push_back(changedProperties(message));
    else if (sd_bus_message_is_signal(message, "org.freedesktop.DBus", "NameOwnerChanged") > 0)
        heard.push_back(ownerChange(message));
    else if (sd_bus_message_is_signal(message, playerInterface, "Seeked") > 0) {
        std::int64_t position = -1;
        require(sd_bus_message_read(message, "x", &position), "position");
        heard.push_back("Seeked " + std::to_string(position));
    } else
        heard.emplace_back(sd_bus_message_get_member(message));
    return 0;
}

int BusListener::hearAnswer(sd_bus_message* message, void* listener, sd_bus_error*) {
    const sd_bus_error* error = sd_bus_message_get_error(message);
    static_cast<BusListener*>(listener)->answers_.emplace_back(error ? error->name : "");
    return 0;
}

/// One step; false when the deadline passed without one.
bool BusListener::processUntil(std::chrono::steady_clock::time_point deadline) {
    if (sd_bus_process(bus_, nullptr) > 0)
        return true;
    const auto left =
        std::chrono::duration_cast<std::chrono::microseconds>(deadline - std::chrono::steady_clock::now());
    if (left.count() <= 0)
        return false;
    sd_bus_wait(bus_, static_cast<std::uint64_t>(left.count()));
    return true;
}

std::optional<std::string> BusListener::next(std::chrono::milliseconds limit) {
    const auto deadline = std::chrono::steady_clock::now() + limit;
    while (heard_.empty())
        if (!processUntil(deadline))
            return std::nullopt;
    std::string line = std::move(heard_.front());
    heard_.pop_front();
    return line;
}

std::vector<std::string> BusListener::until(const std::string& last, std::chrono::milliseconds limit) {
    std::vector<std::string> lines;
    while (auto line = next(limit)) {
        if (*line == last)
            return lines;
        lines.push_back(std::move(*line));
    }
    lines.emplace_back("(no \"" + last + "\")");
    return lines;
}

bool BusListener::isOnBus() { return sd_bus_get_name_creds(bus_, name_.c_str(), 0, nullptr) >= 0; }

bool BusListener::waitForPlayer(std::chrono::milliseconds limit) {
    const auto deadline = std::chrono::steady_clock::now() + limit;
    while (!isOnBus())
        if (!processUntil(deadline))
            return false;
    while (sd_bus_process(bus_, nullptr) > 0) {
    }
    std::erase(heard_, "appeared");
    return true;
}

std::string BusListener::call(const std::string& method) {
    begin(method);
    return answer(std::chrono::seconds(10)).value_or("(no answer)");
}

void BusListener::begin(const std::string& method) {
    require(sd_bus_call_method_async(bus_, nullptr, name_.c_str(), path, playerInterface, method.c_str(),
                                     hearAnswer, this, ""),
            "call");
}

std::optional<std::string> BusListener::answer(std::chrono::milliseconds limit) {
    const auto deadline = std::chrono::steady_clock::now() + limit;
    while (answers_.empty())
        if (!processUntil(deadline))
            return std::nullopt;
    std::string result = std::move(answers_.front());
    answers_.pop_front();
    return result;
}

int BusListener::readAllProperties() {
    return countProperties(rootInterface) + countProperties(playerInterface);
}

int BusListener::countProperties(const char* interface) {
    sd_bus_message* reply = nullptr;
    if (sd_bus_call_method(bus_, name_.c_str(), path, propertiesInterface, "GetAll", nullptr, &reply, "s",
                           interface) < 0)
        return 0;
    int count = 0;
    require(sd_bus_message_enter_container(reply, 'a', "{sv}"), "properties");
    while (sd_bus_message_skip(reply, "{sv}") > 0 && ++count > 0)
        if (sd_bus_message_at_end(reply, 0) > 0)
            break;
    sd_bus_message_unref(reply);
    return count;
}

} // namespace tarn
