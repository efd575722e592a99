#include "client/tool/CommandLine.h"

#include <CLI/CLI.hpp>

#include <cmath>
#include <cstdlib>
#include <iostream>
#include <string>
#include <string_view>

#include "client/tool/Command.h"
#include "client/tool/Completion.h"
#include "client/tool/Info.h"
#include "client/tool/LineMode.h"
#include "client/tool/display/TimeText.h"
#include "client/tool/play/Play.h"
#include "client/tool/remote/Control.h"

namespace tarn::tool {

namespace {

constexpr char description[] = R"(Plays audio files in the background, through the service tarnd.)";

constexpr char footer[] = R"("tarnctl COMMAND --help" and "man tarnctl" tell more.

The service serves one program at a time: play and send take over from the program before. The other commands act
on what plays, whoever plays it.)";

constexpr char playHelp[] = R"(On a terminal a line shows what plays, and keys control it:
  space pause and go on   n next   left/right 10 s back and on   [ ] slower and faster   q quit
Without a FILE, what is paused goes on.
The exit status is 0 when everything was played or somebody quit, and 1 when not.)";

constexpr char sendHelp[] =
    R"(Each LINE is one command; without any they are read from standard input. Beside the commands:
  grant token=TOKEN path=PATH     hand an open file to the service
  wait                            wait for the ends of all commands before
  wait EVENT [FIELD=VALUE]...     wait for such an event
The exit status is 1 when a command failed, and 0 when none did.

  tarnctl send 'asset.upsertWithMetaData identifier=song URL=file:///music/song.flac'

The commands with their fields, and the events that can be waited for:
)";

/// Accepts what parseTime() does.
std::string checkTime(const std::string& text) {
    return parseTime(text) ? "" : "a time is given as SECONDS, MINUTES:SECONDS or HOURS:MINUTES:SECONDS";
}

/// Accepts every rate that something is heard at.
std::string checkRate(const std::string& text) {
    char* end = nullptr;
    const float rate = std::strtof(text.c_str(), &end);
    const bool isNumber = !text.empty() && *end == '\0';
    return isNumber && std::abs(rate) <= 4 && rate != 0
               ? ""
               : "a rate is a number up to 4 that is not 0, or down to -4 to play backwards";
}

/// The table of commands and options, which the help, the parser and the completions of shells come from.
class CommandLine {
public:
    CommandLine() : app_(description, "tarnctl") {
        app_.set_version_flag("--version", "tarnctl " TARN_VERSION);
        app_.add_option("--socket", socketPath_, "Where the service listens")
            ->capture_default_str()
            ->type_name("PATH");
        app_.require_subcommand(1);
        app_.footer(footer);
        addPlay();
        addControls();
        addInfo();
        addSend();
        addComplete();
    }

    std::function<int()> parse(int argc, char** argv) {
        try {
            app_.parse(argc, argv);
        } catch (const CLI::ParseError& problem) {
            const int status = app_.exit(problem) == 0 ? 0 : 2;
            return [status] { return status; };
        }
        return action_;
    }

private:
    /// A command that runs `action` when it was asked for.
    template <class Action>
    CLI::App* add(const char* name, const char* text, Action action) {
        auto* command = app_.add_subcommand(name, text);
        command->final_callback([this, action] { action_ = action; });
        return command;
    }

    void addPlay() {
        auto* play = add("play", "Play files, folders and playlists; without any, go on", [this] {
            play_.socketPath = socketPath_;
            play_.playback.from = *parseTime(from_);
            return play_.names.empty() ? control(Control::play) : runPlay(play_);
        });
        play->footer(playHelp);
        play->add_option("--rate", play_.playback.rate,
                         "How fast: 1 as recorded, 0.25 to 4; below 0 backwards, one file")
            ->check(checkRate, "RATE")
            ->capture_default_str();
        play->add_option("--from", from_, "Where to begin in the first file: SECONDS or MINUTES:SECONDS")
            ->check(checkTime, "TIME");
        addGrant(*play, play_.playback.access);
        play->add_flag("--shuffle", play_.playback.order.isShuffled, "In another order each time");
        play->add_flag("--loop", play_.playback.order.isLooped, "Begin anew after the last one");
        play->add_flag("--detach", play_.isDetached, "Give the prompt back when it sounds, and play on");
        play->add_option("FILE", play_.names,
                         "A file, a folder, a playlist, or - for a list on standard input");
    }

    void addControls() {
        const auto add = [this](const char* name, const char* text, Control control) {
            return this->add(name, text, [this, control] { return this->control(control); });
        };
        const auto addValue = [&](CLI::App* command, const char* name, const char* text, Control control) {
            return command->add_option(name, control_.value, text)
                ->check([control](const std::string& value) {
                    return faultOfControlValue(control, value).value_or("");
                })
                ->type_name("");
        };
        add("pause", "Pause what plays", Control::pause);
        add("toggle", "Pause what plays, or go on", Control::toggle);
        add("next", "Go on to the next track", Control::next);
        add("stop", "End what plays in the background, or pause what another program plays", Control::stop);
        addValue(add("seek", "Move within the track", Control::seek), "[+-]TIME",
                 "Where to, or how far on or back: 1:30, +10, -10", Control::seek)
            ->required();
        addValue(add("rate", "Show or set how fast it plays", Control::rate), "RATE",
                 "1 as recorded, 1.5 faster", Control::rate);
        addValue(add("volume", "Show or set how loud it plays", Control::volume), "[+-]VOLUME",
                 "From 0 to 100, or how much louder or softer: +5, -5", Control::volume);
        auto* status = add("status", "Show what plays", Control::status);
        status->add_flag("--json", control_.asJSON, "Print JSON lines");
        status->add_flag("--follow", control_.follow, "Go on with a line for each change");
    }

    int control(Control control) {
        control_.control = control;
        control_.socketPath = socketPath_;
        return runControl(control_);
    }

    void addInfo() {
        auto* info = add("info", "Show what files say of themselves", [this] { return runInfo(info_); });
        info->add_flag("--json", info_.asJSON, "Print one JSON object for each file");
        info->add_option("FILE", info_.paths, "What to read")->required();
    }

    void addSend() {
        auto* send = add("send", "Send commands, and print every answer and event as one line", [this] {
            send_.socketPath = socketPath_;
            return runLineMode(send_);
        });
        send->footer(sendHelp + describeCommands());
        send->add_flag_callback(
            "--json", [this] { send_.format = LineFormat::JSON; }, "Print JSON lines");
        send->add_flag("--follow", send_.follow, "Go on printing events after the last command");
        send->add_option("LINE", send_.lines, "A command with its fields");
    }

    void addGrant(CLI::App& command, Access& access) {
        command.add_flag_callback(
            "--grant", [&access] { access = Access::granted; },
            "Open the files here and hand them over, for files that the service may not open");
    }

    /// For the shells: prints what the last of the words may become.
    void addComplete() {
        auto* complete = add("complete", "", [this] { return runComplete(app_, completed_); });
        complete->group("")->prefix_command();
        complete->add_option("WORD", completed_);
    }

    CLI::App app_;
    std::function<int()> action_;
    std::string socketPath_ = client::defaultSocketPath();
    PlayOptions play_;
    std::string from_ = "0";
    InfoOptions info_;
    LineModeOptions send_;
    ControlOptions control_;
    std::vector<std::string> completed_;
};

} // namespace

std::function<int()> parseCommandLine(int argc, char** argv) {
    static CommandLine commandLine; // what it gives back uses it
    return commandLine.parse(argc, argv);
}

} // namespace tarn::tool
