#include "controls/SleepGuard.h"

#include <utility>

#include <fcntl.h>

#include "log/SystemLog.h"

namespace tarn {

namespace {

constexpr char sleepMethod[] = "SleepGuard";
constexpr char loginService[] = "org.freedesktop.login1";
constexpr char loginPath[] = "/org/freedesktop/login1";
constexpr char loginInterface[] = "org.freedesktop.login1.Manager";

} // namespace

SleepGuard::SleepGuard(BusLoop& loop, RemoteTargets& targets, RemoteCommandThread& commands,
                       std::string systemBusAddress)
    : loop_(loop),
      targets_(targets),
      commands_(commands),
      connection_(loop.event(), std::move(systemBusAddress), "system bus", BusConnection::Report::nothing,
                  *this) {}

SleepGuard::~SleepGuard() = default;

void SleepGuard::setPlaying(bool playing) {
    if (std::exchange(playing_, playing) == playing)
        return;
    if (!playing)
        releaseLocks();
    else if (bus_)
        takeLocks();
    else
        connection_.open();
}

void SleepGuard::busConnected(sd_bus& bus) {
    bus_ = &bus;
    sd_bus_slot* slot = nullptr;
    sd_bus_match_signal_async(bus_, &slot, loginService, loginPath, loginInterface, "PrepareForSleep",
                              handlePrepareForSleep, nullptr, this);
    sleepSignal_.reset(slot);
    if (playing_)
        takeLocks();
}

void SleepGuard::busLost() {
    releaseLocks();
    sleepSignal_.reset();
    bus_ = nullptr;
}

void SleepGuard::takeLocks() {
    take(idle_, "idle", "block", "Audio is playing");
    take(sleep_, "sleep", "delay", "Audio is paused before sleep");
}

void SleepGuard::releaseLocks() {
    idle_.release();
    sleep_.release();
}

void SleepGuard::take(Lock& lock, const char* what, const char* mode, const char* why) {
    sd_bus_slot* slot = nullptr;
    sd_bus_call_method_async(bus_, &slot, loginService, loginPath, loginInterface, "Inhibit", handleLock,
                             &lock, "ssss", what, "tarnd", why, mode);
    lock.request.reset(slot);
}

int SleepGuard::handleLock(sd_bus_message* reply, void* lock, sd_bus_error*) {
    int descriptor = -1; // the message's own
    if (sd_bus_message_is_method_error(reply, nullptr) == 0 &&
        sd_bus_message_read(reply, "h", &descriptor) >= 0)
        static_cast<Lock*>(lock)->held.reset(fcntl(descriptor, F_DUPFD_CLOEXEC, 3));
    return 0;
}

int SleepGuard::handlePrepareForSleep(sd_bus_message* message, void* guard, sd_bus_error*) {
    auto& self = *static_cast<SleepGuard*>(guard);
    int beginning = 0;
    if (sd_bus_message_read(message, "b", &beginning) < 0)
        return 0;
    if (beginning == 0) {
        if (self.playing_)
            self.takeLocks(); // something was told to play while the system fell asleep
        return 0;
    }
    if (self.playing_ || self.commands_.isBusy())
        self.pause();
    return 0;
}

void SleepGuard::pause() {
    SystemLog::message(sleepMethod, __LINE__, "%{public}s:%d: Pausing before the system sleeps.");
    const auto pauseAll = [&targets = targets_] { return targets.deliver(RemoteCommandKind::pause); };
    const bool busy = commands_.isBusy(); // before the pause, beside which it may end
    if (!pauses_)
        pauses_.emplace(loop_);
    if (!pauses_->deliver(pauseAll, [this](RemoteCommandResult) { sleep_.release(); }))
        sleep_.release();
    if (busy)
        static_cast<void>(commands_.deliver(pauseAll, nullptr));
}

} // namespace tarn
