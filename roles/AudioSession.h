#pragma once

#include <cstdint>
#include <functional>
#include <optional>

#include "roles/Error.h"

namespace tarn {

/// The process's claim to the sound output. One shared instance; any thread may call.
///
/// Interruptions are posted to the notification centre under interruptionNotification with the session as
/// sender, on the session's own thread; the information holds `interruptionTypeKey` and, for an ended one,
/// maybe `interruptionOptionsKey`.
class AudioSession {
public:
    enum class Category : std::uint8_t { playback };
    enum class Mode : std::uint8_t { standard };
    enum class RouteSharingPolicy : std::uint8_t { standard = 0, longForm = 1 };

    static constexpr char interruptionNotification[] = "AudioSessionInterruption";
    static constexpr char interruptionTypeKey[] = "AudioSessionInterruptionType";
    static constexpr char interruptionOptionsKey[] = "AudioSessionInterruptionOption";
    static constexpr std::uint64_t interruptionEnded = 0;
    static constexpr std::uint64_t interruptionBegan = 1;
    static constexpr std::uint64_t optionShouldResume = 1;

    /// Receives whether it worked, and the error when it did not.
    using ActivationCompletion = std::function<void(bool success, const std::optional<Error>& error)>;

    virtual ~AudioSession() = default;

    /// Returns what went wrong, or nothing.
    [[nodiscard]] virtual std::optional<Error>
    setCategory(Category category, Mode mode, RouteSharingPolicy policy, std::uint64_t options) = 0;

    /// Returns at once. `completion` runs exactly once, on the session's own thread, at the latest when the
    /// session goes.
    virtual void activateWithOptions(std::uint64_t options, ActivationCompletion completion) = 0;
};

} // namespace tarn
