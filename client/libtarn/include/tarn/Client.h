#pragma once

#include <chrono>
#include <functional>
#include <future>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <tarn/Connection.h>
#include <tarn/Event.h>

namespace tarn::client {

/// What is asked of the service for one audio file. Texts that are absent are read from the file.
struct AssetUpsert {
    std::string identifier;
    std::optional<std::string> URL{}; ///< a file: URL, see fileURL(); absent: only the texts are changed
    std::optional<std::string> title{};
    std::optional<std::string> albumTitle{};
    std::optional<std::string> artist{};
    std::optional<std::string> sandboxExtensionToken{}; ///< see Client::grantFile()
};

/// What the service knows about an audio file.
struct AssetInfo {
    double duration = 0; ///< seconds
    std::optional<std::string> title;
    std::optional<std::string> albumTitle;
    std::optional<std::string> artist;
};

/// The URL of a file; a relative path is taken from the current folder.
std::string fileURL(const std::string& path);

/// Plays audio files through the service: a program makes assets from files, player items from assets and
/// queue players from items, each under an identifier of its choosing, and follows the events.
///
/// The last component of a queue player's identifier, split at commas, names the program to the system's
/// media controls: "music,org.example.Player".
///
/// Every command returns at once with a future of how it ends, so commands can be sent ahead. Commands about
/// items run beside those about assets and queue players: wait for an answer before a command that builds on
/// the other kind. A future that is let go lets the command run. Any thread may call, but a handler of events
/// must not wait for a future or for nextEvent(), nor throw. A command of more than 1 MiB throws
/// std::length_error. See Connection about losing the connection.
class Client {
public:
    struct Options {
        std::string socketPath = defaultSocketPath();
        /// Gets every event, on a thread of the library's own. Without it events wait for nextEvent(), the
        /// last 4,096 of them.
        std::function<void(const Event& event)> onEvent{};
    };

    /// Connects. Throws std::system_error when nobody listens or access is denied.
    Client();
    explicit Client(Options options);
    ~Client();

    /// Makes or replaces an asset. Without a URL nothing is made and the answer is empty.
    std::future<Result<AssetInfo>> upsertAsset(const AssetUpsert& asset);
    std::future<Completion> destroyAsset(const std::string& asset);

    /// Makes or replaces an item that plays the asset.
    std::future<Result<Status>> upsertItem(const std::string& item, const std::string& asset);
    std::future<Completion> destroyItem(const std::string& item);
    /// The position that is heard, in seconds.
    std::future<Result<double>> currentTime(const std::string& item);
    /// Moves the position, in seconds, to within 1/60 s; beyond the end is the end.
    std::future<Completion> setCurrentTime(const std::string& item, double seconds);

    /// Makes or replaces a queue player of these items, paused.
    std::future<Result<Status>> upsertQueuePlayer(const std::string& player,
                                                  const std::vector<std::string>& items);
    std::future<Completion> destroyQueuePlayer(const std::string& player);
    /// 1 plays as recorded, 0 pauses, below 0 plays backwards. PlayerRateChanged tells when it is so.
    std::future<Completion> setRate(const std::string& player, float rate);
    std::future<Completion> advanceToNextItem(const std::string& player);
    std::future<Completion> appendItem(const std::string& player, const std::string& item);
    std::future<Completion> removeItem(const std::string& player, const std::string& item);
    std::future<Completion> removeAllItems(const std::string& player);
    std::future<Completion> replaceCurrentItem(const std::string& player, const std::string& item);

    /// Opens a file, hands it to the service, and returns the token for AssetUpsert::sandboxExtensionToken of
    /// the asset with this file's URL. Good once, on this connection. Throws std::system_error when the file
    /// cannot be opened.
    std::string grantFile(const std::string& path);

    /// Waits for the next event. None when the limit passed, or when the connection is lost and every event
    /// up to ConnectionLost was taken.
    std::optional<Event> nextEvent(std::chrono::milliseconds limit);
    std::optional<Event> nextEvent();

    /// Connects anew; all objects have to be made again. Events of the old connection that still wait are
    /// dropped, and futures of it that are not ready end as `connectionLost`. Throws std::system_error; then
    /// there is no connection. Not from a handler.
    void reconnect();

    /// The connection below, for commands of one's own encoding.
    Connection& connection();

private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

} // namespace tarn::client
