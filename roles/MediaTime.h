#pragma once

#include <cstdint>

namespace tarn {

/// A point or length of time in a file: `value` units of 1/`timescale` seconds.
///
/// A time made from a number that is not finite is not numeric: it converts to NaN and no engine acts on it.
class MediaTime {
public:
    constexpr MediaTime() = default;
    constexpr MediaTime(std::int64_t value, std::int32_t timescale) : value_(value), timescale_(timescale) {}

    static constexpr MediaTime zero() { return {0, 1}; }

    /// Rounds to the nearest unit; saturates at the ends of the 64-bit range.
    static MediaTime fromSeconds(double seconds, std::int32_t timescale);

    bool isNumeric() const { return timescale_ > 0; }
    std::int64_t value() const { return value_; }
    std::int32_t timescale() const { return timescale_; }
    double seconds() const;

    bool operator==(const MediaTime&) const = default;

private:
    std::int64_t value_ = 0;
    std::int32_t timescale_ = 0;
};

} // namespace tarn
