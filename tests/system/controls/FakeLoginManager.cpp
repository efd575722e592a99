#include "tests/system/controls/FakeLoginManager.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <stdexcept>

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

namespace tarn {

namespace {

constexpr char managerPath[] = "/org/freedesktop/login1";
constexpr char managerInterface[] = "org.freedesktop.login1.Manager";

} // namespace

FakeLoginManager::FakeLoginManager(const std::string& address) {
    static const sd_bus_vtable table[] = {
        SD_BUS_VTABLE_START(0),
        SD_BUS_METHOD("Inhibit", "ssss", "h", inhibit, SD_BUS_VTABLE_UNPRIVILEGED),
        SD_BUS_SIGNAL("PrepareForSleep", "b", 0),
        SD_BUS_VTABLE_END,
    };
    sd_bus_new(&bus_);
    sd_bus_set_address(bus_, address.c_str());
    sd_bus_set_bus_client(bus_, 1);
    if (sd_bus_start(bus_) < 0 ||
        sd_bus_add_object_vtable(bus_, nullptr, managerPath, managerInterface, table, this) < 0 ||
        sd_bus_request_name(bus_, "org.freedesktop.login1", 0) < 0)
        throw std::runtime_error("no login manager");
}

bool FakeLoginManager::waitForLocks(const std::vector<std::string>& locks) {
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (std::chrono::steady_clock::now() < deadline) {
        while (sd_bus_process(bus_, nullptr) > 0) {
        }
        if (heldLocks() == locks)
            return true;
        std::vector<pollfd> changes{{.fd = sd_bus_get_fd(bus_), .events = POLLIN, .revents = 0}};
        for (const Lock& lock : locks_)
            changes.push_back({.fd = lock.end.get(), .events = 0, .revents = 0});
        poll(changes.data(), changes.size(), 1000);
    }
    return false;
}

void FakeLoginManager::prepareForSleep(bool beginning) {
    sd_bus_emit_signal(bus_, managerPath, managerInterface, "PrepareForSleep", "b", beginning ? 1 : 0);
    sd_bus_flush(bus_);
}

int FakeLoginManager::inhibit(sd_bus_message* message, void* manager, sd_bus_error*) {
    const char* what = nullptr;
    const char* who = nullptr;
    const char* why = nullptr;
    const char* mode = nullptr;
    std::array<int, 2> ends{};
    if (sd_bus_message_read(message, "ssss", &what, &who, &why, &mode) < 0 ||
        pipe2(ends.data(), O_CLOEXEC) != 0)
        return -EINVAL;
    const FileDescriptor given(ends[0]);
    static_cast<FakeLoginManager*>(manager)->locks_.push_back(
        {std::string(what) + ":" + mode, FileDescriptor(ends[1])});
    return sd_bus_reply_method_return(message, "h", given.get());
}

std::vector<std::string> FakeLoginManager::heldLocks() {
    std::erase_if(locks_, [](const Lock& lock) {
        pollfd state{.fd = lock.end.get(), .events = 0, .revents = 0};
        return poll(&state, 1, 0) != 0;
    });
    std::vector<std::string> names;
    for (const Lock& lock : locks_)
        names.push_back(lock.name);
    std::ranges::sort(names);
    return names;
}

} // namespace tarn
