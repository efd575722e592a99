#pragma once

#include <chrono>
#include <optional>
#include <string>

#include "controls/BusHandles.h"

namespace tarn {

/// Is told of a connection. On the bus thread.
class BusConnectionClient {
public:
    virtual ~BusConnectionClient() = default;

    /// The bus has given the connection a name: everything can be sent.
    virtual void busConnected(sd_bus& bus) = 0;

    /// What was made on the bus is void; it must be let go within this call.
    virtual void busLost() = 0;
};

/// A connection to one bus that is made once it is wanted, and made again whenever it is lost. On the bus
/// thread.
///
/// While there is no bus, it tries again a few times and then once a minute, and at once when the bus's
/// socket appears (an address that names no file is tried every second instead); with a bus it wakes up for
/// nothing.
class BusConnection final {
public:
    enum class Report { outages, nothing };

    /// `name` is for the log, which gets one line for the loss of the bus and one for its return.
    BusConnection(sd_event* event, std::string address, std::string name, Report report,
                  BusConnectionClient& client);
    ~BusConnection();

    BusConnection(const BusConnection&) = delete;
    BusConnection& operator=(const BusConnection&) = delete;

    /// Connects, unless that was asked before. The connection then stays for good.
    void open();

private:
    using Clock = std::chrono::steady_clock;

    static int handleConnected(sd_bus_message* message, void* connection, sd_bus_error* error);
    static int handleDisconnected(sd_bus_message* message, void* connection, sd_bus_error* error);
    static int handleFolder(sd_event_source* source, const inotify_event* event, void* connection);

    int connect();
    void waitForBus(int reason);
    void tryAgainAfter(std::chrono::microseconds delay);
    void tryAgain();
    void watchFolder();
    void reportLoss(int reason);
    void reportReturn();

    sd_event* const event_;
    const std::string address_;
    const std::string name_;
    const Report report_;
    BusConnectionClient& client_;

    BusHandle bus_;
    bool opened_ = false;
    bool lossReported_ = false;
    std::optional<Clock::time_point> connectedSince_;
    std::chrono::microseconds delay_{0}; // between the last two tries; zero before the second one
    EventSourceHandle timer_;
    EventSourceHandle folder_; // set while there is no bus
    std::string awaitedName_;
};

} // namespace tarn
