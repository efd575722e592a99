#include <CLI/CLI.hpp>

#include <clocale>
#include <cmath>
#include <cstdlib>
#include <exception>
#include <iostream>
#include <string>
#include <system_error>

#include "client/tool/Command.h"
#include "client/tool/Info.h"
#include "client/tool/LineMode.h"
#include "client/tool/Play.h"
#include "client/tool/TimeText.h"

namespace {

using namespace tarn::tool;

constexpr char description[] = R"(Plays audio files in the background, through the service tarnd.

The service serves one program at a time: every use of tarnctl takes over from the one before.)";

constexpr char playHelp[] = R"(On a terminal a line shows what plays, and keys control it:
  space pause and go on   n next   left/right 10 s back and on   [ ] slower and faster   q quit
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

struct Options {
    std::string socketPath = tarn::client::defaultSocketPath();
    PlayOptions play;
    InfoOptions info;
    LineModeOptions send;
    std::string from = "0";
    bool grant = false;
    bool asJSON = false;
};

CLI::App* addPlay(CLI::App& app, Options& options) {
    auto* play = app.add_subcommand("play", "Plays files one after the other.");
    play->footer(playHelp);
    play->add_option("--rate", options.play.rate,
                     "How fast: 1 as recorded, 0.25 to 4; below 0 backwards, one file")
        ->check(checkRate, "RATE")
        ->capture_default_str();
    play->add_option("--from", options.from, "Where to begin in the first file: SECONDS or MINUTES:SECONDS")
        ->check(checkTime, "TIME");
    play->add_flag("--grant", options.grant,
                   "Open the files here and hand them over, for files that the service may not open");
    play->add_option("FILE", options.play.paths, "What to play")->required();
    return play;
}

CLI::App* addInfo(CLI::App& app, Options& options) {
    auto* info = app.add_subcommand("info", "Shows what the service reads from files.");
    info->add_flag("--json", options.asJSON, "One JSON object for each file");
    info->add_flag("--grant", options.grant, "Open the files here and hand them over");
    info->add_option("FILE", options.info.paths, "What to read")->required();
    return info;
}

CLI::App* addSend(CLI::App& app, Options& options) {
    auto* send = app.add_subcommand("send", "Sends commands, and prints every answer and event as one line.");
    send->footer(sendHelp + describeCommands());
    send->add_flag("--json", options.asJSON, "Print JSON lines");
    send->add_flag("--follow", options.send.follow, "Go on printing events after the last command");
    send->add_option("LINE", options.send.lines, "A command with its fields");
    return send;
}

} // namespace

int main(int argc, char** argv) {
    std::setlocale(LC_CTYPE, ""); // how wide characters are on this terminal
    Options options;
    CLI::App app(description, "tarnctl");
    app.set_version_flag("--version", "tarnctl " TARN_VERSION);
    app.add_option("--socket", options.socketPath, "Where the service listens")->capture_default_str();
    app.require_subcommand(1);
    app.footer("tarnctl COMMAND --help tells more.");
    const auto* play = addPlay(app, options);
    const auto* info = addInfo(app, options);
    addSend(app, options);
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& problem) {
        return app.exit(problem) == 0 ? 0 : 2;
    }
    options.play.socketPath = options.info.socketPath = options.send.socketPath = options.socketPath;
    options.play.access = options.info.access = options.grant ? Access::granted : Access::service;
    options.play.from = *parseTime(options.from);
    if (options.play.rate < 0 && options.play.paths.size() > 1) {
        std::cerr << "tarnctl: only one file can be played backwards\n";
        return 2;
    }
    options.info.asJSON = options.asJSON;
    options.send.format = options.asJSON ? LineFormat::JSON : LineFormat::text;
    try {
        return *play ? runPlay(options.play) : *info ? runInfo(options.info) : runLineMode(options.send);
    } catch (const std::system_error& problem) {
        std::cerr << "tarnctl: cannot reach the service: " << problem.what() << "\nIs tarnd running?\n";
    } catch (const std::exception& problem) {
        std::cerr << "tarnctl: " << problem.what() << "\n";
    }
    return 1;
}
