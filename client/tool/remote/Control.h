#pragma once

#include <optional>
#include <string>

namespace tarn::tool {

enum class Control { pause, play, toggle, next, stop, seek, rate, volume, status };

struct ControlOptions {
    std::string socketPath; ///< of the service
    Control control = Control::status;
    std::string value{}; ///< of seek, rate and volume, without a fault; empty: show what it is
    bool asJSON = false;
    bool follow = false; ///< status: goes on with a line for each change, until a signal
};

/// What is wrong with the value; none when nothing is.
std::optional<std::string> faultOfControlValue(Control control, const std::string& value);

/// Controls what plays now, whoever started it, or shows it. The exit status: 0 when it was done. Throws
/// Problem.
int runControl(const ControlOptions& options);

} // namespace tarn::tool
