#pragma once

#include <optional>
#include <string>

namespace tarn::tool {

/// "3:07" or "1:02:03", rounded down; "-:--" when it is not finite.
std::string timeText(double seconds);

/// Seconds of "83", "83.5", "1:23.5" or "1:02:03"; none when the text is no time.
std::optional<double> parseTime(const std::string& text);

} // namespace tarn::tool
