#include "client/tool/remote/Adjustment.h"

#include <charconv>
#include <string_view>

#include "client/tool/display/TimeText.h"

namespace tarn::tool {

namespace {

template <class Parse>
std::optional<Adjustment> parseWithSign(const std::string& text, Parse parse) {
    const bool isRelative = text.starts_with('+') || text.starts_with('-');
    const std::optional<double> amount = parse(isRelative ? text.substr(1) : text);
    if (!amount)
        return std::nullopt;
    return Adjustment{isRelative, text.starts_with('-') ? -*amount : *amount};
}

std::optional<double> parseNumber(std::string_view text) {
    if (text.ends_with('%'))
        text.remove_suffix(1);
    double number = 0;
    const auto end = text.data() + text.size();
    const auto result = std::from_chars(text.data(), end, number, std::chars_format::fixed);
    return result.ec == std::errc() && result.ptr == end && number >= 0 ? std::optional(number)
                                                                        : std::nullopt;
}

} // namespace

std::optional<Adjustment> parseTimeAdjustment(const std::string& text) {
    return parseWithSign(text, parseTime);
}

std::optional<Adjustment> parseAdjustment(const std::string& text) {
    return parseWithSign(text, parseNumber);
}

} // namespace tarn::tool
