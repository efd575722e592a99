#pragma once

#include <list>
#include <set>

#include "player/EventLoop.h"
#include "roles/AudioSession.h"
#include "roles/NotificationCenter.h"
#include "sound/InterruptionListener.h"
#include "sound/SoundServer.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// The audio session of this machine. It is activated when there is something to sound on, and is interrupted
/// when the sound server asks for silence or a call begins, until that is over.
///
/// Completions and notifications come on the player thread, in their order: nobody who waits for one may be
/// there.
class LinuxAudioSession final : public AudioSession, public InterruptionListener {
public:
    /// All of these outlive the session.
    LinuxAudioSession(EventLoop& loop, SoundServer& server, NotificationCenter& notifications);

    /// The loop has been stopped. Activations that were not answered fail now.
    ~LinuxAudioSession() override;

    [[nodiscard]] std::optional<Error> setCategory(Category category, Mode mode, RouteSharingPolicy policy,
                                                   std::uint64_t options) override;
    void activateWithOptions(std::uint64_t options, ActivationCompletion completion) override;

    void streamInterrupted(const void* stream) override;
    void streamReleased(const void* stream) override;
    void streamGone(const void* stream) override;

private:
    using Pending = std::list<ActivationCompletion>;

    void complete(Pending::iterator activation, const std::optional<Error>& error);
    void notify(std::uint64_t type, std::optional<std::uint64_t> options);

    EventLoop& loop_;
    SoundServer& server_;
    NotificationCenter& notifications_;
    MutexProtected<Pending> pending_;
    std::set<const void*> interrupted_; // player thread
};

} // namespace tarn
