#include "client/tool/Tracks.h"

#include <deque>
#include <filesystem>
#include <future>
#include <system_error>
#include <utility>

namespace tarn::tool {

namespace {

/// Asked of the service ahead of its answers; fewer than the tokens that may wait.
constexpr std::size_t mostAhead = 32;

struct Opening {
    Track track;
    std::future<client::Result<client::AssetInfo>> result;
};

} // namespace

std::string Track::title() const {
    return info.title && !info.title->empty() ? *info.title : std::filesystem::path(path).filename().string();
}

std::vector<Track> openTracks(client::Client& client, const std::vector<std::string>& paths, Access access,
                              const std::function<void(const std::string&, const std::string&)>& refused) {
    std::vector<Track> tracks;
    std::deque<Opening> ahead;
    const auto takeFirst = [&] {
        auto [track, future] = std::move(ahead.front());
        ahead.pop_front();
        auto result = future.get();
        if (result.outcome != client::Outcome::answered)
            return refused(track.path, result.succeeded() ? "the service gave no answer" : result.problem());
        track.info = std::move(result.value);
        tracks.push_back(std::move(track));
    };
    for (const auto& path : paths) {
        if (ahead.size() == mostAhead)
            takeFirst();
        Track track{path, std::to_string(&path - paths.data() + 1), {}};
        client::AssetUpsert upsert{.identifier = track.identifier, .URL = client::fileURL(path)};
        try {
            if (access == Access::granted)
                upsert.sandboxExtensionToken = client.grantFile(path);
        } catch (const std::system_error& problem) {
            refused(path, problem.code().message());
            continue;
        }
        ahead.push_back({std::move(track), client.upsertAsset(upsert)});
    }
    while (!ahead.empty())
        takeFirst();
    return tracks;
}

} // namespace tarn::tool
