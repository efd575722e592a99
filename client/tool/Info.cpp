#include "client/tool/Info.h"

#include <iostream>

#include "client/tool/display/OutputLine.h"
#include "client/tool/display/Terminal.h"
#include "client/tool/display/TimeText.h"
#include "client/tool/play/ServiceCheck.h"

namespace tarn::tool {

namespace {

void printLine(const char* name, const std::optional<std::string>& text) {
    if (text && !text->empty())
        std::cout << "  " << name << printable(*text) << "\n";
}

void print(const Track& track) {
    std::cout << printable(track.path) << "\n";
    printLine("title     ", track.info.title);
    printLine("artist    ", track.info.artist);
    printLine("album     ", track.info.albumTitle);
    printLine("duration  ", timeText(track.info.duration));
}

void printJSON(const Track& track) {
    Dictionary fields;
    fields["path"].value = track.path;
    fields["duration"].value = track.info.duration;
    if (track.info.title)
        fields["title"].value = *track.info.title;
    if (track.info.artist)
        fields["artist"].value = *track.info.artist;
    if (track.info.albumTitle)
        fields["albumTitle"].value = *track.info.albumTitle;
    std::cout << outputLine(LineFormat::JSON, "file", fields) << "\n";
}

} // namespace

int runInfo(const InfoOptions& options) {
    client::Client client({.socketPath = options.socketPath, .reconnectLimit = std::chrono::seconds(30)});
    checkThatServiceAnswers(client);
    int status = 0;
    const auto tracks = openTracks(client, options.paths, options.access,
                                   [&](const std::string& path, const std::string& reason) {
                                       status = 1;
                                       std::cerr << "tarnctl: " << printable(path + ": " + reason) << "\n";
                                   });
    for (const auto& track : tracks)
        options.asJSON ? printJSON(track) : print(track);
    return status;
}

} // namespace tarn::tool
