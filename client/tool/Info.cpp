#include "client/tool/Info.h"

#include <exception>
#include <iostream>
#include <stdexcept>

#include "client/tool/display/Columns.h"
#include "client/tool/display/OutputLine.h"
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

Track open(client::Client& client, const std::string& path, Access access) {
    client::AssetUpsert upsert{.identifier = "info", .URL = client::fileURL(path)};
    if (access == Access::granted)
        upsert.sandboxExtensionToken = client.grantFile(path);
    const auto result = client.await(client.upsertAsset(upsert));
    if (result.outcome != client::Outcome::answered)
        throw std::runtime_error(result.succeeded() ? "the service gave no answer" : result.problem());
    return {path, "info", 0, 0, result.value};
}

} // namespace

int runInfo(const InfoOptions& options) {
    client::Client client({.socketPath = options.socketPath, .reconnectLimit = std::chrono::seconds(30)});
    checkThatServiceAnswers(client);
    int status = 0;
    for (const auto& path : options.paths) {
        try {
            const auto track = open(client, path, options.access);
            options.asJSON ? printJSON(track) : print(track);
        } catch (const std::exception& problem) {
            status = 1;
            std::cerr << "tarnctl: " << printable(path + ": " + problem.what()) << "\n";
        }
    }
    return status;
}

} // namespace tarn::tool
