#include "tests/system/controls/FakeLoginManager.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <stdexcept>

#include <fcntl.h>
#include <poll.h>
#include <systemd/sd-bus.h>
#include <unistd.h>

#include "system/FileDescriptor.h"

namespace tarn {

namespace {

constexpr char managerPath[] = "/org/freedesktop/login1";
constexpr char managerInterface[] = "org.freedesktop.login1.Manager";

/// A lock is held until the other end of its pipe is closed.
struct Held {
    std::string name;
    FileDescriptor end;

    bool isHeld() const {
        pollfd state{.fd = end.get(), .events = 0, .revents = 0};
        return poll(&state, 1, 0) == 0;
    }
};

} // namespace

/// Runs on the thread that waits; the bus keeps what comes meanwhile.
class FakeLoginManager::Implementation {
public:
    explicit Implementation(const std::string& address) {
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

    ~Implementation() { sd_bus_close_unref(bus_); }

    Implementation(const Implementation&) = delete;
    Implementation& operator=(const Implementation&) = delete;

    bool waitForLocks(const std::vector<std::string>& locks) {
        const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
        while (std::chrono::steady_clock::now() < deadline) {
            while (sd_bus_process(bus_, nullptr) > 0) {
            }
            if (names() == locks)
                return true;
            waitForChange();
        }
        return false;
    }

    void prepareForSleep(bool beginning) {
        sd_bus_emit_signal(bus_, managerPath, managerInterface, "PrepareForSleep", "b", beginning ? 1 : 0);
        sd_bus_flush(bus_);
    }

private:
    static int inhibit(sd_bus_message* message, void* manager, sd_bus_error*) {
        const char* what = nullptr;
        const char* who = nullptr;
        const char* why = nullptr;
        const char* mode = nullptr;
        if (const int result = sd_bus_message_read(message, "ssss", &what, &who, &why, &mode); result < 0)
            return result;
        std::array<int, 2> ends{};
        if (pipe2(ends.data(), O_CLOEXEC) != 0)
            return -errno;
        const FileDescriptor given(ends[0]);
        auto& self = *static_cast<Implementation*>(manager);
        self.held_.push_back({std::string(what) + ":" + mode, FileDescriptor(ends[1])});
        return sd_bus_reply_method_return(message, "h", given.get());
    }

    std::vector<std::string> names() {
        std::erase_if(held_, [](const Held& lock) { return !lock.isHeld(); });
        std::vector<std::string> result;
        for (const Held& lock : held_)
            result.push_back(lock.name);
        std::sort(result.begin(), result.end());
        return result;
    }

    void waitForChange() {
        std::vector<pollfd> changes{{.fd = sd_bus_get_fd(bus_), .events = POLLIN, .revents = 0}};
        for (const Held& lock : held_)
            changes.push_back({.fd = lock.end.get(), .events = 0, .revents = 0});
        poll(changes.data(), changes.size(), 1000);
    }

    sd_bus* bus_ = nullptr;
    std::vector<Held> held_;
};

FakeLoginManager::FakeLoginManager(const std::string& address)
    : implementation_(std::make_unique<Implementation>(address)) {}

FakeLoginManager::~FakeLoginManager() = default;

bool FakeLoginManager::waitForLocks(const std::vector<std::string>& locks) {
    return implementation_->waitForLocks(locks);
}

void FakeLoginManager::prepareForSleep(bool beginning) { implementation_->prepareForSleep(beginning); }

} // namespace tarn
