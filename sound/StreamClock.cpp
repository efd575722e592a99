#include "sound/StreamClock.h"

#include <algorithm>
#include <cmath>

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr std::size_t mostReports = 16; // a quarter of a minute: devices drift by a millisecond in that
constexpr int mostLooks = 64;
constexpr StreamClock::Time pauseBetweenLooks = 4ms;
constexpr double tolerance = 0.001; // seconds

} // namespace

void StreamClock::reset(std::uint32_t rate) {
    rate_ = rate;
    reports_.clear();
    looks_ = 0;
    settled_ = false;
}

double StreamClock::framesSince(Time begin, Time time) const {
    return std::chrono::duration<double>(time - begin).count() * rate_;
}

// What would have been heard at the origin, if the device had played evenly since.
double StreamClock::startOf(const Report& report) const {
    return static_cast<double>(report.heard) - framesSince(origin_, report.time);
}

void StreamClock::add(const Report& report) {
    if (reports_.empty())
        origin_ = report.time;
    else
        settled_ |= settles(report);
    ++looks_;
    reports_.push_back(report);
    if (reports_.size() > mostReports)
        reports_.pop_front();
    start_ = startOf(*std::ranges::min_element(reports_, {}, [this](const Report& r) { return startOf(r); }));
}

// Two reports tell only when they are so close together that no cycle fits in between unseen.
bool StreamClock::settles(const Report& report) const {
    const Time apart = report.time - reports_.back().time;
    const double leap = startOf(report) - startOf(reports_.back());
    const bool evenly = std::fabs(leap) < tolerance * rate_;
    return apart >= pauseBetweenLooks / 2 && apart <= 2 * pauseBetweenLooks && (evenly || leap > 0);
}

std::optional<StreamClock::Time> StreamClock::pauseBeforeNext() const {
    if (settled_ || looks_ >= mostLooks)
        return std::nullopt;
    return pauseBetweenLooks;
}

std::int64_t StreamClock::heardAt(Time time) const {
    return std::llround(start_ + framesSince(origin_, time));
}

std::int64_t StreamClock::depth() const {
    std::int64_t most = 0;
    for (const Report& report : reports_)
        most = std::max(most, report.taken - heardAt(report.time));
    return most;
}

} // namespace tarn
