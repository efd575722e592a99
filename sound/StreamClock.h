#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <optional>

namespace tarn {

/// Makes a steady clock out of what a sound server reports of a stream. Player thread.
///
/// The problem: each report costs a message there and back, so there shall be one a second at most; and some
/// servers report what they knew when they last filled the device, which may be a twentieth of a second ago,
/// and say that it is so now. Their reports run ahead of the ear by up to such a cycle, each by another part
/// of it:
///
///     frame   reports of   .   /.      the line under all reports is the
///       ^     such a   . / .  /        truth: a device plays evenly, and
///       |     server  ./ .   /         no server reports less than is heard
///       |            /.  . /
///       +-----------------------> time
///
/// The idea: the clock is the line under the last reports. When sound begins, reports are asked for every few
/// milliseconds, until they either move evenly, so that each is the truth, or have been seen to leap, so that
/// the one before the leap was the truth. From then on the line is kept up with a report for each refill.
class StreamClock {
public:
    using Time = std::chrono::nanoseconds; ///< of the steady clock

    /// What the server says, in frames of the output.
    struct Report {
        std::int64_t heard; ///< this frame is heard at `time`, or will be soon
        std::int64_t taken; ///< frames before this one have left for the device
        Time time;
    };

    /// Nothing is known any more; the frames have `rate` a second.
    void reset(std::uint32_t rate);

    void add(const Report& report);

    /// Until when another report should follow, if the clock is not known well yet.
    std::optional<Time> pauseBeforeNext() const;

    bool known() const { return !reports_.empty(); }

    /// The frame that is heard at `time`. Known only.
    std::int64_t heardAt(Time time) const;

    /// How many frames at most the device holds ahead of the ear, as far as reports have shown.
    std::int64_t depth() const;

private:
    double framesSince(Time begin, Time time) const;
    double startOf(const Report& report) const;
    bool settles(const Report& report) const;

    std::uint32_t rate_ = 44100;
    std::deque<Report> reports_;
    Time origin_{0};
    double start_ = 0; // heard at `origin_`
    int looks_ = 0;    // reports since reset()
    bool settled_ = false;
};

} // namespace tarn
