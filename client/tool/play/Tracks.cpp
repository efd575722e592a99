#include "client/tool/play/Tracks.h"

#include <unistd.h>

#include <deque>
#include <filesystem>
#include <future>
#include <system_error>
#include <utility>

#include "client/tool/play/ServiceCheck.h"

namespace tarn::tool {

namespace {

/// Asked of the service ahead of its answers; fewer than the tokens that may wait.
constexpr std::size_t mostAhead = 32;

/// How often everything is opened, when the service forgets its client.
constexpr int mostAttempts = 3;

struct Opening {
    Track track;
    std::future<client::Result<client::AssetInfo>> result;
};

struct Opened {
    std::vector<Track> tracks;
    std::vector<std::pair<std::string, std::string>> refused; // path and reason
    bool forgotten = false;
};

/// Names of their own, so that another program's objects are never taken for these.
std::string identifierOf(std::size_t index) {
    return std::to_string(::getpid()) + "-" + std::to_string(index + 1);
}

Opened openOnce(client::Client& client, const std::vector<std::string>& paths, Access access) {
    Opened opened;
    std::deque<Opening> ahead;
    const auto takeFirst = [&] {
        auto [track, future] = std::move(ahead.front());
        ahead.pop_front();
        auto result = future.get();
        if (result.outcome == client::Outcome::answered) {
            track.info = std::move(result.value);
            opened.tracks.push_back(std::move(track));
            return;
        }
        opened.forgotten |= wasForgotten(result);
        opened.refused.emplace_back(track.path,
                                    result.succeeded() ? "the service gave no answer" : result.problem());
    };
    for (std::size_t index = 0; index < paths.size(); ++index) {
        if (ahead.size() == mostAhead)
            takeFirst();
        const auto& path = paths[index];
        Track track{path, identifierOf(index), {}};
        client::AssetUpsert upsert{.identifier = track.identifier, .URL = client::fileURL(path)};
        try {
            if (access == Access::granted)
                upsert.sandboxExtensionToken = client.grantFile(path);
        } catch (const std::system_error& problem) {
            opened.refused.emplace_back(path, problem.code().message());
            continue;
        }
        ahead.push_back({std::move(track), client.upsertAsset(upsert)});
    }
    while (!ahead.empty())
        takeFirst();
    return opened;
}

} // namespace

std::string Track::title() const {
    return info.title && !info.title->empty() ? *info.title : std::filesystem::path(path).filename().string();
}

std::vector<Track> openTracks(client::Client& client, const std::vector<std::string>& paths, Access access,
                              const std::function<void(const std::string&, const std::string&)>& refused) {
    auto opened = openOnce(client, paths, access);
    for (int attempt = 1; opened.forgotten && attempt < mostAttempts && servesNobody(client); ++attempt) {
        client.reconnect();
        opened = openOnce(client, paths, access);
    }
    for (const auto& [path, reason] : opened.refused)
        refused(path, reason);
    return std::move(opened.tracks);
}

} // namespace tarn::tool
