#include "client/tool/remote/Control.h"

#include <algorithm>
#include <cmath>
#include <iostream>

#include "client/tool/display/Columns.h"
#include "client/tool/display/OutputLine.h"
#include "client/tool/display/Problem.h"
#include "client/tool/display/TimeText.h"
#include "client/tool/remote/Adjustment.h"
#include "client/tool/remote/BackgroundRecord.h"
#include "client/tool/remote/RemotePlayer.h"

namespace tarn::tool {

namespace {

using State = PlayerStatus::State;

constexpr double percent = 100;

class Controller {
public:
    explicit Controller(const ControlOptions& options) : options_(options), background_(options.socketPath) {}

    void run() {
        if (options_.control == Control::status)
            return showStatus();
        if (options_.control == Control::stop && background_.endProcess())
            return;
        RemotePlayer player;
        const auto status = player.status();
        if (!status.hasTrack())
            throw Problem("nothing plays", "Start something: tarnctl play FILE...");
        switch (options_.control) {
        case Control::play: // what plays already would go back to the rate 1
            return status.state == State::playing ? void() : player.command("Play");
        case Control::pause:
            return player.command("Pause");
        case Control::toggle:
            return player.command("PlayPause");
        case Control::next:
            return player.command("Next");
        case Control::stop:
            return player.command("Stop");
        case Control::seek:
            return seek(player, status);
        case Control::rate:
            return options_.value.empty() ? show(status.rate) : setRate(player, status);
        case Control::volume:
            return options_.value.empty() ? show(std::round(status.volume * percent))
                                          : setVolume(player, status);
        case Control::status:
            break;
        }
    }

private:
    void seek(RemotePlayer& player, const PlayerStatus& status) const {
        if (!status.canSeek)
            throw Problem("what plays now cannot be moved from outside",
                          "The keys of \"tarnctl play\" move in what it plays.");
        const double target = parseTimeAdjustment(options_.value)->appliedTo(status.position);
        if (status.duration && target > *status.duration)
            throw Problem("it ends at " + timeText(*status.duration), "For the next track: tarnctl next");
        player.moveTo(status.trackPath, std::max(0.0, target));
    }

    void setRate(RemotePlayer& player, const PlayerStatus& status) const {
        const double rate = parseAdjustment(options_.value)->amount;
        if (rate < status.slowestRate || rate > status.fastestRate)
            throw Problem("the rates of what plays now go from " + plainText({status.slowestRate}) + " to " +
                              plainText({status.fastestRate}),
                          "The keys [ and ] of \"tarnctl play\" change the rate of what it plays.");
        player.setRate(rate);
    }

    void setVolume(RemotePlayer& player, const PlayerStatus& status) const {
        const double volume = parseAdjustment(options_.value)->appliedTo(status.volume * percent);
        player.setVolume(std::clamp(volume, 0.0, percent) / percent);
    }

    static void show(double value) { std::cout << plainText({value}) << std::endl; }

    void showStatus() {
        RemotePlayer player;
        if (options_.follow)
            player.watch();
        auto shown = player.status();
        print(shown);
        while (options_.follow && std::cout) {
            const bool jumped = player.waitForChange();
            auto now = player.status();
            if (jumped || !now.looksLike(shown))
                print(now);
            shown = std::move(now);
        }
    }

    void print(const PlayerStatus& status) const {
        const auto background = background_.read();
        if (options_.asJSON) {
            auto fields = statusFields(status);
            if (background)
                fields["background"].value = backgroundFields(*background);
            std::cout << outputLine(LineFormat::JSON, "status", fields) << std::endl;
            return;
        }
        std::cout << statusLine(status) << "\n";
        if (background)
            printBackground(*background);
        std::cout << std::flush;
    }

    static Dictionary backgroundFields(const BackgroundRecord::Content& background) {
        DictionaryList problems;
        for (const auto& problem : background.problems)
            problems.push_back({problem});
        Dictionary fields;
        fields["process"].value = std::int64_t{background.process};
        fields["track"].value = std::uint64_t{background.track};
        fields["tracks"].value = std::uint64_t{background.tracks};
        fields["problems"].value = std::move(problems);
        return fields;
    }

    static void printBackground(const BackgroundRecord::Content& background) {
        std::cout << "In the background, track " << background.track << " of " << background.tracks
                  << "; \"tarnctl stop\" ends it.\n";
        for (const auto& problem : background.problems)
            std::cout << "Not played: " << printable(problem) << "\n";
    }

    const ControlOptions& options_;
    const BackgroundRecord background_;
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
