#pragma once

#include <condition_variable>
#include <deque>
#include <mutex>
#include <set>
#include <thread>

#include "roles/AudioSession.h"
#include "roles/NotificationCenter.h"
#include "sound/InterruptionListener.h"

namespace tarn {

/// The audio session of this machine. The sound server is what arbitrates: activation always succeeds, and an
/// interruption begins when the server asks for silence and ends when it takes that back.
///
/// Completions and notifications come on the session's own thread, in their order.
class LinuxAudioSession final : public AudioSession, public InterruptionListener {
public:
    /// `notifications` outlives the session.
    explicit LinuxAudioSession(NotificationCenter& notifications);

    /// Not on the session's thread; completions that have not run run before it returns.
    ~LinuxAudioSession() override;

    [[nodiscard]] std::optional<Error> setCategory(Category category, Mode mode, RouteSharingPolicy policy,
                                                   std::uint64_t options) override;
    void activateWithOptions(std::uint64_t options, ActivationCompletion completion) override;

    void streamInterrupted(const void* stream) override;
    void streamReleased(const void* stream) override;
    void streamGone(const void* stream) override;

private:
    void perform(std::function<void()> work);
    void run();
    void notify(std::uint64_t type, std::optional<std::uint64_t> options);

    NotificationCenter& notifications_;
    std::set<const void*> interrupted_; // player thread

    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<std::function<void()>> work_; // under the mutex
    bool ending_ = false;                    // under the mutex
    std::thread thread_;
};

} // namespace tarn
