#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "controls/BusConnection.h"
#include "controls/BusHandles.h"
#include "controls/BusLoop.h"
#include "controls/RemoteCommandThread.h"
#include "controls/RemoteTargets.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// Keeps the login manager from putting an idle device to sleep while something plays, and pauses before any
/// other sleep. On the bus thread.
///
/// The pause is the remote command, so that it reaches every player like a press of the button and playback
/// stays paused after the device has woken up. The system waits for it by a delay lock, for as long as the
/// login manager allows (five seconds by default). Another command under way may take longer: then the
/// pause is delivered beside it, on a thread of its own, and once more behind it, lest it play on.
/// Both locks are held only while something plays. Without a login manager, or without a system bus, nothing
/// happens and nothing is logged.
class SleepGuard final : public BusConnectionClient {
public:
    SleepGuard(BusLoop& loop, RemoteTargets& targets, RemoteCommandThread& commands,
               std::string systemBusAddress);
    ~SleepGuard() override;

    void setPlaying(bool playing);

    void busConnected(sd_bus& bus) override;
    void busLost() override;

private:
    /// One lock of the login manager: held as long as its descriptor is open.
    struct Lock {
        SlotHandle request;
        FileDescriptor held;

        void release() {
            request.reset();
            held.reset();
        }
    };

    static int handleLock(sd_bus_message* reply, void* lock, sd_bus_error* error);
    static int handlePrepareForSleep(sd_bus_message* message, void* guard, sd_bus_error* error);

    void pause();
    void takeLocks();
    void releaseLocks();
    void take(Lock& lock, const char* what, const char* mode, const char* why);

    BusLoop& loop_;
    RemoteTargets& targets_;
    RemoteCommandThread& commands_;
    std::optional<RemoteCommandThread> pauses_; // from the first sleep on
    bool playing_ = false;

    sd_bus* bus_ = nullptr; // null while there is no connection
    SlotHandle sleepSignal_;
    Lock idle_;
    Lock sleep_;
    BusConnection connection_;
};

} // namespace tarn
