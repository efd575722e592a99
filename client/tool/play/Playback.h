#pragma once

#include <chrono>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include <tarn/Client.h>

#include "client/tool/play/PlayOrder.h"
#include "client/tool/play/Track.h"
#include "client/tool/play/TrackQueue.h"

namespace tarn::tool {

/// Plays a list of files through the service: what a person wants of it, and what became of that.
///
/// A person may press keys faster than the service answers. So what they mean is kept apart from what the
/// service tells: the rate and the position that are wanted are known at once, and the next key starts from
/// there.
///
/// Nothing waits. For the thread that calls the client's drainEvents().
class Playback {
public:
    struct Options {
        float rate = 1;
        double from = 0; // seconds into the first file
        Access access = Access::service;
        PlayOrder::Options order;
    };
    struct Listener {
        std::function<void()> changed;                                    ///< what the functions below say
        std::function<void(const std::string& line)> told;                ///< news
        std::function<void(const std::string& problem)> failed;           ///< with one file: the rest goes on
        std::function<void(const std::string& reason, int status)> ended; ///< once, with the exit status
    };

    Playback(client::Client& client, std::vector<std::string> files, const Options& options,
             Listener listener);

    void begin();
    void handle(const client::Event& event);

    void pauseOrGoOn();
    void skip();
    void seekBy(double seconds);
    void changeRateBy(float step);
    /// Asks where it is; `changed` follows.
    void askPosition();

    /// What plays; null while nothing does.
    const Track* current() const { return current_ ? &*current_ : nullptr; }
    std::size_t size() const { return queue_.size(); }
    bool isPlaying() const { return rate_ != 0; }
    /// As it is meant; until the first sound, as it is.
    bool isPaused() const { return !wantsToPlay_ || (!hasStarted_ && rate_ == 0); }
    float usualRate() const { return usualRate_; }
    double position() const;
    /// Since when the service is gone, while that lasts. What plays goes on when it is back.
    std::optional<std::chrono::steady_clock::time_point> goneSince() const { return goneSince_; }

private:
    using Clock = std::chrono::steady_clock;

    void start();
    void takeStart(const client::Completion& completion);
    void setRate(float rate, const client::Client::Handler<client::Completion>& ended = {});
    void takeRate(float rate);
    void takeCurrentItem(const std::optional<std::string>& item);
    void takePosition(double position);
    void noteFailure(const std::string& item, const std::optional<client::Error>& error);
    void reportUnexplained();
    void fail(const std::string& problem);
    void endIfNothingIsLeft();
    void end(const std::string& reason, int status);

    client::Client& client_;
    const Options options_;
    const Listener listener_;
    const std::string player_;
    TrackQueue queue_;

    std::optional<Track> current_;
    float rate_ = 0; // as the service told
    double position_ = 0;
    Clock::time_point positionTime_{};
    bool positionAsked_ = false;
    /// What the position that was asked for is to tell about the stop before it.
    enum class Stop { none, pause, backwards };
    Stop asksWhy_ = Stop::none;

    bool wantsToPlay_ = true;
    float usualRate_; // what to go on at after a pause
    int ratesAsked_ = 0;
    std::optional<double> wantedPosition_; // of seeks that are on their way
    int seeksAsked_ = 0;
    bool hasStarted_ = false;
    std::optional<Clock::time_point> goneSince_;

    std::map<std::string, std::string> unexplained_; // failed items and their paths, until the reason comes
    std::set<std::string> reported_;                 // failed items
    bool hasFailed_ = false;
    bool hasEnded_ = false;
};

} // namespace tarn::tool
