#pragma once

#include <chrono>
#include <deque>
#include <optional>
#include <string>
#include <vector>

#include <systemd/sd-bus.h>

namespace tarn {

/// Listens to a media player on a bus, and calls its methods. For one thread.
///
/// What it hears is told in one line each: "Player: PlaybackStatus Metadata" for changed properties, with a
/// "!" before the names that were only invalidated; "Seeked 90000000"; "appeared" and "vanished" for the
/// name.
class BusListener final {
public:
    static constexpr char playerName[] = "org.mpris.MediaPlayer2.tarnd";

    explicit BusListener(const std::string& address, std::string name = playerName);
    ~BusListener();

    BusListener(const BusListener&) = delete;
    BusListener& operator=(const BusListener&) = delete;

    /// The next line; none when the limit passed without one.
    std::optional<std::string> next(std::chrono::milliseconds limit = std::chrono::seconds(10));

    /// Reads lines up to `last`, which is not among those returned.
    std::vector<std::string> until(const std::string& last,
                                   std::chrono::milliseconds limit = std::chrono::seconds(10));

    /// Waits until the name is on the bus.
    [[nodiscard]] bool waitForPlayer(std::chrono::milliseconds limit = std::chrono::seconds(10));

    /// Calls a method of org.mpris.MediaPlayer2.Player: empty when it succeeded, else the name of the error.
    std::string call(const std::string& method);

    /// Sends the call; answer() tells how the first one that has no answer yet ended.
    void begin(const std::string& method);
    std::optional<std::string> answer(std::chrono::milliseconds limit);

    /// Reads every property of both interfaces; the number of properties, 0 when it failed.
    int readAllProperties();

private:
    static int hear(sd_bus_message* message, void* listener, sd_bus_error* error);
    static int hearAnswer(sd_bus_message* message, void* listener, sd_bus_error* error);

    bool processUntil(std::chrono::steady_clock::time_point deadline);
    bool isOnBus();
    int countProperties(const char* interface);

    const std::string name_;
    sd_bus* bus_ = nullptr;
    std::deque<std::string> heard_;
    std::deque<std::string> answers_;
};

} // namespace tarn
