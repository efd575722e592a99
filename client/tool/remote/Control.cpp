#include "client/tool/remote/Control.h"

#include <algorithm>
#include <cmath>
#include <iostream>

#include "client/tool/display/OutputLine.h"
#include "client/tool/display/Problem.h"
#include "client/tool/display/TimeText.h"
#include "client/tool/remote/Adjustment.h"
#include "client/tool/remote/RemotePlayer.h"

namespace tarn::tool {

namespace {

using State = PlayerStatus::State;

constexpr double percent = 100;

class Controller {
public:
    explicit Controller(const ControlOptions& options) : options_(options) {}

    void run() {
        if (options_.control == Control::status)
            return showStatus();
        const auto status = player_.status();
        if (!status.hasTrack())
            throw Problem("nothing plays", "Start something: tarnctl play FILE...");
        switch (options_.control) {
        case Control::play: // what plays already would go back to the rate 1
            return status.state == State::playing ? void() : player_.command("Play");
        case Control::pause:
            return player_.command("Pause");
        case Control::toggle:
            return player_.command("PlayPause");
        case Control::next:
            return player_.command("Next");
        case Control::stop:
            return player_.command("Stop");
        case Control::seek:
            return seek(status);
        case Control::rate:
            return options_.value.empty() ? show("rate", status.rate) : setRate(status);
        case Control::volume:
            return options_.value.empty() ? show("volume", std::round(status.volume * percent))
                                          : setVolume(status);
        case Control::status:
            break;
        }
    }

private:
    void seek(const PlayerStatus& status) {
        if (!status.canSeek)
            throw Problem("what plays now cannot be moved from outside",
                          "The keys of \"tarnctl play\" move in what it plays.");
        const double target = parseTimeAdjustment(options_.value)->appliedTo(status.position);
        if (status.duration && target > *status.duration)
            throw Problem("it ends at " + timeText(*status.duration), "For the next track: tarnctl next");
        player_.moveTo(status.trackPath, std::max(0.0, target));
    }

    void setRate(const PlayerStatus& status) {
        const double rate = parseAdjustment(options_.value)->amount;
        if (rate < status.slowestRate || rate > status.fastestRate)
            throw Problem("what plays now has rates from " + plainText({status.slowestRate}) + " to " +
                              plainText({status.fastestRate}),
                          "The keys [ and ] of \"tarnctl play\" change the rate of what it plays.");
        player_.setRate(rate);
    }

    void setVolume(const PlayerStatus& status) {
        const double volume = parseAdjustment(options_.value)->appliedTo(status.volume * percent);
        player_.setVolume(std::clamp(volume, 0.0, percent) / percent);
    }

    void show(const char* name, double value) const {
        Dictionary fields;
        fields[name].value = value;
        print(plainText({value}), fields);
    }

    void showStatus() {
        if (options_.follow)
            player_.watch();
        auto shown = player_.status();
        print(statusLine(shown), statusFields(shown));
        while (options_.follow && std::cout) {
            const bool jumped = player_.waitForChange();
            auto now = player_.status();
            if (jumped || !now.looksLike(shown))
                print(statusLine(now), statusFields(now));
            shown = std::move(now);
        }
    }

    void print(const std::string& line, const Dictionary& fields) const {
        std::cout << (options_.asJSON ? outputLine(LineFormat::JSON, "status", fields) : line) << std::endl;
    }

    const ControlOptions& options_;
    RemotePlayer player_;
};

} // namespace

std::optional<std::string> faultOfControlValue(Control control, const std::string& value) {
    if (control == Control::seek)
        return parseTimeAdjustment(value)
                   ? std::nullopt
                   : std::optional("a time is SECONDS, MINUTES:SECONDS or HOURS:MINUTES:SECONDS, with + "
                                   "or - before it to move on or back");
    const auto adjustment = parseAdjustment(value);
    if (control == Control::volume && !adjustment)
        return "a volume is from 0 to 100, with + or - before it to raise or lower it";
    if (control == Control::rate && (!adjustment || adjustment->isRelative || adjustment->amount == 0))
        return "a rate is a number over 0, such as 1.5";
    return std::nullopt;
}

int runControl(const ControlOptions& options) {
    Controller(options).run();
    return 0;
}

} // namespace tarn::tool
