#pragma once

#include <optional>
#include <string>

namespace tarn::tool {

/// A value as a person gives it: "1:30" is where to, "+10" and "-10" how far from where it is.
struct Adjustment {
    bool isRelative = false;
    double amount = 0;

    double appliedTo(double value) const { return isRelative ? value + amount : amount; }
};

/// None when it is not one. Times as parseTime() has them.
std::optional<Adjustment> parseTimeAdjustment(const std::string& text);

/// None when it is not one. A number; a percent sign may follow.
std::optional<Adjustment> parseAdjustment(const std::string& text);

} // namespace tarn::tool
