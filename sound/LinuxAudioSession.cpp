#include "sound/LinuxAudioSession.h"

#include <utility>

#include "sound/SoundError.h"

namespace tarn {

namespace {

// A sound server that is being started is there by then; a person who waits hears why nothing sounds.
constexpr std::chrono::milliseconds activationLimit{1500};

} // namespace

LinuxAudioSession::LinuxAudioSession(EventLoop& loop, SoundServer& server, NotificationCenter& notifications)
    : loop_(loop), server_(server), notifications_(notifications) {}

LinuxAudioSession::~LinuxAudioSession() {
    for (const auto& completion : pending_.withLocked([](Pending& all) { return std::exchange(all, {}); }))
        completion(false, soundError(SoundErrorCode::noServer));
}

// One category, and streams are always described as music: nothing here can be refused.
std::optional<Error> LinuxAudioSession::setCategory(Category, Mode, RouteSharingPolicy, std::uint64_t) {
    return std::nullopt;
}

void LinuxAudioSession::activateWithOptions(std::uint64_t, ActivationCompletion completion) {
    const auto activation =
        pending_.withLocked([&](Pending& all) { return all.insert(all.end(), std::move(completion)); });
    loop_.post([this, activation] {
        server_.request(activationLimit, [this, activation](const std::optional<Error>& error) {
            complete(activation, error);
        });
    });
}

void LinuxAudioSession::complete(Pending::iterator activation, const std::optional<Error>& error) {
    const ActivationCompletion completion = std::move(*activation);
    pending_.withLocked([&](Pending& all) { all.erase(activation); });
    completion(!error, error);
}

void LinuxAudioSession::streamInterrupted(const void* stream) {
    interrupted_.insert(stream);
    notify(interruptionBegan, std::nullopt); // also for one that begins to play during an interruption
}

void LinuxAudioSession::streamReleased(const void* stream) {
    if (interrupted_.erase(stream) > 0 && interrupted_.empty())
        notify(interruptionEnded, optionShouldResume);
}

void LinuxAudioSession::streamGone(const void* stream) {
    if (interrupted_.erase(stream) > 0 && interrupted_.empty())
        notify(interruptionEnded, std::nullopt);
}

void LinuxAudioSession::notify(std::uint64_t type, std::optional<std::uint64_t> options) {
    Notification notification{interruptionNotification, static_cast<AudioSession*>(this), {}};
    notification.info[interruptionTypeKey] = type;
    if (options)
        notification.info[interruptionOptionsKey] = *options;
    notifications_.post(notification);
}

} // namespace tarn
