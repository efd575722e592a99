#include "client/tool/display/TimeText.h"

#include <charconv>
#include <cmath>
#include <string_view>

namespace tarn::tool {

namespace {

constexpr int secondsPerMinute = 60;
constexpr int secondsPerHour = 3'600;

std::string twoDigits(long number) { return std::string(number < 10 ? 1 : 0, '0') + std::to_string(number); }

} // namespace

std::string timeText(double seconds) {
    if (!std::isfinite(seconds))
        return "-:--";
    const long whole = std::lround(std::floor(std::fabs(seconds)));
    const long hours = whole / secondsPerHour;
    const long minutes = whole % secondsPerHour / secondsPerMinute;
    const auto rest = std::string(1, ':') + twoDigits(whole % secondsPerMinute);
    const std::string sign = seconds <= -1 ? "-" : "";
    return sign + (hours > 0 ? std::to_string(hours) + ":" + twoDigits(minutes) : std::to_string(minutes)) +
           rest;
}

std::optional<double> parseTime(const std::string& text) {
    double total = 0;
    std::string_view rest = text;
    for (int part = 0; part < 3; ++part) {
        const auto colon = rest.find(':');
        const auto digits = rest.substr(0, colon);
        double number = 0;
        const auto result =
            std::from_chars(digits.data(), digits.data() + digits.size(), number, std::chars_format::fixed);
        if (result.ec != std::errc() || result.ptr != digits.data() + digits.size() ||
            !std::isfinite(number) || number < 0 || (part > 0 && number >= secondsPerMinute))
            return std::nullopt;
        total = total * secondsPerMinute + number;
        if (colon == std::string_view::npos)
            return total;
        rest.remove_prefix(colon + 1);
    }
    return std::nullopt;
}

} // namespace tarn::tool
