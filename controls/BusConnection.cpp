#include "controls/BusConnection.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <utility>

#include <sys/inotify.h>
#include <time.h>

#include "controls/BusAddress.h"
#include "log/SystemLog.h"

namespace tarn {

namespace {

using std::chrono::microseconds;
using std::chrono::milliseconds;
using std::chrono::seconds;

constexpr microseconds firstDelay = milliseconds(20);

/// A bus that has just made its socket file listens well within the sum of the delays up to this one.
constexpr microseconds lastQuickDelay = milliseconds(1000);

/// With the folder watched, trying again serves only buses that refuse for a while.
constexpr microseconds watchedDelay = seconds(60);

constexpr microseconds timerAccuracy = milliseconds(1);

/// A connection that lives shorter may have been ended for what we sent: the next one must not follow at
/// once.
constexpr seconds provenLifetime{10};

constexpr char connectionMethod[] = "BusConnection";

constexpr char localService[] = "org.freedesktop.DBus.Local";
constexpr char localPath[] = "/org/freedesktop/DBus/Local";

} // namespace

BusConnection::BusConnection(sd_event* event, std::string address, std::string name, Report report,
                             BusConnectionClient& client)
    : event_(event), address_(std::move(address)), name_(std::move(name)), report_(report), client_(client) {}

BusConnection::~BusConnection() = default;

void BusConnection::open() {
    if (std::exchange(opened_, true))
        return;
    if (address_.empty())
        reportLoss(EDESTADDRREQ); // for good: the environment of a process does not change
    else if (const int result = connect(); result < 0)
        waitForBus(-result);
}

/// Returns below 0 when there is no bus. Whether there is one that answers shows later.
int BusConnection::connect() {
    sd_bus* bus = nullptr;
    if (const int result = sd_bus_new(&bus); result < 0)
        return result;
    BusHandle handle(bus);
    const auto listen = [&](const char* signal, sd_bus_message_handler_t handler) {
        return sd_bus_match_signal(bus, nullptr, localService, localPath, localService, signal, handler,
                                   this);
    };
    int result = sd_bus_set_address(bus, address_.c_str());
    if (result >= 0)
        result = sd_bus_set_bus_client(bus, 1);
    if (result >= 0)
        result = sd_bus_set_connected_signal(bus, 1);
    if (result >= 0)
        result = listen("Connected", handleConnected);
    if (result >= 0)
        result = listen("Disconnected", handleDisconnected);
    if (result >= 0)
        result = sd_bus_start(bus);
    if (result >= 0)
        result = sd_bus_attach_event(bus, event_, SD_EVENT_PRIORITY_NORMAL);
    if (result >= 0)
        bus_ = std::move(handle);
    return result;
}

int BusConnection::handleConnected(sd_bus_message*, void* connection, sd_bus_error*) {
    auto& self = *static_cast<BusConnection*>(connection);
    self.connectedSince_ = Clock::now();
    self.folder_.reset();
    self.reportReturn();
    self.client_.busConnected(*self.bus_);
    return 0;
}

int BusConnection::handleDisconnected(sd_bus_message*, void* connection, sd_bus_error*) {
    auto& self = *static_cast<BusConnection*>(connection);
    if (const auto since = std::exchange(self.connectedSince_, std::nullopt)) {
        self.client_.busLost();
        if (Clock::now() - *since > provenLifetime)
            self.delay_ = {};
    }
    self.waitForBus(ECONNRESET);
    return 0;
}

void BusConnection::waitForBus(int reason) {
    reportLoss(reason);
    watchFolder();
    if (delay_ == microseconds::zero())
        delay_ = firstDelay;
    else if (delay_ < lastQuickDelay)
        delay_ = std::min(delay_ * 2, lastQuickDelay);
    else
        delay_ = folder_ ? watchedDelay : lastQuickDelay;
    tryAgainAfter(delay_);
}

/// Watches for the socket, or for the first folder on the way to it that is missing.
void BusConnection::watchFolder() {
    const auto socket = busSocketPath(address_);
    if (folder_ || !socket)
        return;
    const std::uint32_t events = IN_CREATE | IN_MOVED_TO | IN_ATTRIB | IN_ONLYDIR;
    for (std::filesystem::path awaited = *socket; awaited.has_relative_path();
         awaited = awaited.parent_path()) {
        const std::string folder = awaited.parent_path();
        sd_event_source* source = nullptr;
        if (sd_event_add_inotify(event_, &source, folder.c_str(), events, handleFolder, this) < 0)
            continue;
        folder_.reset(source);
        awaitedName_ = awaited.filename();
        return;
    }
}

int BusConnection::handleFolder(sd_event_source*, const inotify_event* event, void* connection) {
    auto& self = *static_cast<BusConnection*>(connection);
    const bool folderGone = (event->mask & IN_IGNORED) != 0;
    if (folderGone || (event->len > 0 && event->name == self.awaitedName_)) {
        self.folder_.reset(); // the next try looks anew what is missing
        self.delay_ = {};
        self.tryAgainAfter(microseconds::zero());
    }
    return 0;
}

void BusConnection::tryAgainAfter(microseconds delay) {
    const auto wait = static_cast<std::uint64_t>(delay.count());
    const auto accuracy = static_cast<std::uint64_t>(timerAccuracy.count());
    const auto handle = [](sd_event_source*, std::uint64_t, void* connection) {
        static_cast<BusConnection*>(connection)->tryAgain();
        return 0;
    };
    sd_event_source* source = nullptr;
    if (sd_event_add_time_relative(event_, &source, CLOCK_MONOTONIC, wait, accuracy, handle, this) >= 0)
        timer_.reset(source);
}

void BusConnection::tryAgain() {
    if (connectedSince_)
        return;
    bus_.reset();
    if (const int result = connect(); result < 0)
        waitForBus(-result);
}

void BusConnection::reportLoss(int reason) {
    if (report_ == Report::nothing || std::exchange(lossReported_, true))
        return;
    SystemLog::error(connectionMethod, __LINE__,
                     "%{public}s:%d: The %{public}s is out of reach (%{public}s); going on without it.",
                     name_, std::strerror(reason));
}

void BusConnection::reportReturn() {
    if (std::exchange(lossReported_, false))
        SystemLog::message(connectionMethod, __LINE__, "%{public}s:%d: The %{public}s is back.", name_);
}

} // namespace tarn
