#include "client/tool/remote/Bus.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>

#include "client/tool/display/Problem.h"

namespace tarn::tool {

namespace {

constexpr char playerPath[] = "/org/mpris/MediaPlayer2";

/// The error that an answer brings, freed at the end of its scope.
struct CallError {
    CallError() = default;
    ~CallError() { sd_bus_error_free(&error); }
    CallError(const CallError&) = delete;
    CallError& operator=(const CallError&) = delete;

    template <class... Names>
    bool isOneOf(Names... names) const {
        return (... || (sd_bus_error_has_name(&error, names) != 0));
    }

    sd_bus_error error{nullptr, nullptr, 0};
};

[[noreturn]] void throwProblem(const CallError& problem, int result) {
    if (result == -ETIMEDOUT || problem.isOneOf(SD_BUS_ERROR_NO_REPLY, SD_BUS_ERROR_TIMEOUT))
        throw Problem("the service does not answer", "Its log may say why: journalctl --user -t tarnd");
    if (problem.isOneOf(SD_BUS_ERROR_PROPERTY_READ_ONLY))
        throw Problem("the service does not let that be changed from outside",
                      "The program that plays can change it. Volume: the sound server's mixer, such as "
                      "pavucontrol, too.");
    if (problem.isOneOf("ostrel.tarnd.Error.NoSuchContent"))
        throw Problem("there is nothing more to play", "Start something else: tarnctl play FILE...");
    if (problem.error.message == nullptr)
        requireBus(result);
    throw Problem(std::string("the service refused: ") + problem.error.message,
                  "Its log may say more: journalctl --user -t tarnd");
}

} // namespace

void requireBus(int result) {
    if (result < 0)
        throw Problem(
            std::string("the session bus, over which players are controlled, is out of reach: ") +
                std::strerror(-result), // NOLINT(concurrency-mt-unsafe): there is one thread
            "It comes with a login session: without one install dbus-user-session and log in anew, or set "
            "DBUS_SESSION_BUS_ADDRESS. The keys of \"tarnctl play\" work without a bus.");
}

Bus::Bus() {
    sd_bus* bus = nullptr;
    const int result = sd_bus_open_user(&bus);
    bus_.reset(bus);
    requireBus(result);
}

std::vector<std::string> Bus::namesBelow(const std::string& prefix) const {
    char** listed = nullptr;
    requireBus(sd_bus_list_names(bus_.get(), &listed, nullptr));
    std::vector<std::string> names;
    for (char** name = listed; name != nullptr && *name != nullptr; ++name) {
        const std::string text = *name;
        if (text == prefix || text.starts_with(prefix + "."))
            names.push_back(text);
        std::free(*name); // NOLINT(cppcoreguidelines-no-malloc): so the bus library has made them
    }
    std::free(static_cast<void*>(listed)); // NOLINT(cppcoreguidelines-no-malloc)
    std::sort(names.begin(), names.end());
    return names;
}

MessageHandle Bus::newCall(const std::string& name, const char* interface, const char* member) const {
    sd_bus_message* message = nullptr;
    requireBus(
        sd_bus_message_new_method_call(bus_.get(), &message, name.c_str(), playerPath, interface, member));
    MessageHandle call(message);
    requireBus(sd_bus_message_set_auto_start(message, 0));
    return call;
}

std::optional<MessageHandle> Bus::answer(const MessageHandle& call, std::chrono::microseconds limit) const {
    CallError problem;
    sd_bus_message* reply = nullptr;
    const int result = sd_bus_call(bus_.get(), call.get(), static_cast<std::uint64_t>(limit.count()),
                                   &problem.error, &reply);
    if (result >= 0)
        return MessageHandle(reply);
    if (problem.isOneOf(SD_BUS_ERROR_SERVICE_UNKNOWN, SD_BUS_ERROR_NAME_HAS_NO_OWNER,
                        SD_BUS_ERROR_UNKNOWN_OBJECT, SD_BUS_ERROR_UNKNOWN_INTERFACE))
        return std::nullopt;
    throwProblem(problem, result);
}

} // namespace tarn::tool
