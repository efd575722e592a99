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
/// **Commands.** Every command comes in two forms, which both return at once: one gives a future of how it
/// ends, the other calls a handler with it. So commands can be sent ahead. Commands about items run beside
/// those about assets and queue players: wait for an answer before a command that builds on the other kind. A
/// future that is let go lets the command run. A command of more than 1 MiB throws std::length_error.
///
/// **Threads.** Any thread may call. Handlers, of events and of ends, run one at a time: on the library's
/// thread, or with Driver::program inside drainEvents(), await() and nextEvent(). A handler must not wait for
/// a future or for an event, nor call reconnect() or the destructor, nor throw: what it throws is dropped.
/// When it is known at once that a command cannot be carried out, its handler runs on the calling thread.
/// Signals and fork(): see Connection.
///
/// **A lost connection.** By default every command that waits ends as `connectionLost`, ConnectionLost is
/// told, and the program may call reconnect() and make its objects again.
///
/// With Options::reconnectLimit the library remembers what it made for the program, and a crash or an update
/// of the service costs a short silence: Reconnecting is told; the library connects anew as soon as the
/// service is back, makes all objects again with their positions, queues and rates, what sounds first; and
/// Reconnected is told. Commands that were waiting, and those given meanwhile, are carried out after that and
/// end as usual; each takes effect once. currentTime() tells meanwhile where playing will go on. When it has
/// not worked within the limit, all ends with ConnectionLost as above. An asset whose file is gone by then
/// fails its items, as ItemStatusChanged and ItemFailedToPlayToEnd tell. A file that grantFile() opened is
/// handed over again; it stays open for that, if this leaves the program half of its descriptors, or else is
/// opened again by its path. What is sent through connection() is not remembered.
///
/// **Taken over.** The service serves the program that connects last. Who is replaced is told TakenOver, and
/// nothing more; commands then end as `takenOver`. The library does not connect anew by itself, as the two
/// programs would throw each other out for ever. reconnect() takes over again. Closing the connection that
/// was replaced makes the service forget the other program's objects too, so it is kept until reconnect() or
/// the end of the Client.
class Client {
public:
    struct Options {
        std::string socketPath = defaultSocketPath();
        /// Gets every event. Without it events wait for nextEvent() or drainEvents(), the last 4,096 of them.
        std::function<void(const Event& event)> onEvent{};
        Driver driver = Driver::ownThread;
        /// For how long to try, from the loss of a connection on, until all objects are back. 0: not at all.
        std::chrono::milliseconds reconnectLimit{0};
    };

    /// May be empty.
    template <class Ending>
    using Handler = std::function<void(Ending ending)>;

    /// Connects. Throws as Connection does.
    Client();
    explicit Client(Options options);
    ~Client();

    /// Makes or replaces an asset. Without a URL nothing is made and the answer is empty.
    std::future<Result<AssetInfo>> upsertAsset(const AssetUpsert& asset);
    void upsertAsset(const AssetUpsert& asset, Handler<Result<AssetInfo>> ended);
    std::future<Completion> destroyAsset(const std::string& asset);
    void destroyAsset(const std::string& asset, Handler<Completion> ended);

    /// Makes or replaces an item that plays the asset.
    std::future<Result<Status>> upsertItem(const std::string& item, const std::string& asset);
    void upsertItem(const std::string& item, const std::string& asset, Handler<Result<Status>> ended);
    std::future<Completion> destroyItem(const std::string& item);
    void destroyItem(const std::string& item, Handler<Completion> ended);
    /// The position that is heard, in seconds.
    std::future<Result<double>> currentTime(const std::string& item);
    void currentTime(const std::string& item, Handler<Result<double>> ended);
    /// Moves the position, in seconds, to within 1/60 s; beyond the end is the end.
    std::future<Completion> setCurrentTime(const std::string& item, double seconds);
    void setCurrentTime(const std::string& item, double seconds, Handler<Completion> ended);

    /// Makes or replaces a queue player of these items, paused.
    std::future<Result<Status>> upsertQueuePlayer(const std::string& player,
                                                  const std::vector<std::string>& items);
    void upsertQueuePlayer(const std::string& player, const std::vector<std::string>& items,
                           Handler<Result<Status>> ended);
    std::future<Completion> destroyQueuePlayer(const std::string& player);
    void destroyQueuePlayer(const std::string& player, Handler<Completion> ended);
    /// 1 plays as recorded, 0 pauses, below 0 plays backwards. PlayerRateChanged tells when it is so.
    std::future<Completion> setRate(const std::string& player, float rate);
    void setRate(const std::string& player, float rate, Handler<Completion> ended);
    std::future<Completion> advanceToNextItem(const std::string& player);
    void advanceToNextItem(const std::string& player, Handler<Completion> ended);
    std::future<Completion> appendItem(const std::string& player, const std::string& item);
    void appendItem(const std::string& player, const std::string& item, Handler<Completion> ended);
    std::future<Completion> removeItem(const std::string& player, const std::string& item);
    void removeItem(const std::string& player, const std::string& item, Handler<Completion> ended);
    std::future<Completion> removeAllItems(const std::string& player);
    void removeAllItems(const std::string& player, Handler<Completion> ended);
    std::future<Completion> replaceCurrentItem(const std::string& player, const std::string& item);
    void replaceCurrentItem(const std::string& player, const std::string& item, Handler<Completion> ended);

    /// Opens a file, hands it to the service, and returns the token for AssetUpsert::sandboxExtensionToken of
    /// the asset with this file's URL. Good once, on this connection. Throws std::system_error when the file
    /// cannot be opened.
    std::string grantFile(const std::string& path);

    /// Waits for the next event. None when the limit passed, or when every event was taken up to
    /// ConnectionLost or TakenOver.
    std::optional<Event> nextEvent(std::chrono::milliseconds limit);
    std::optional<Event> nextEvent();

    /// With Driver::program, a descriptor that is readable whenever drainEvents() has something to do: for
    /// poll(2) and every main loop that can watch a descriptor. Good until the destructor; not to be read
    /// from. -1 with Driver::ownThread.
    int eventDescriptor() const;

    /// With Driver::program, first does all that there is to do, without waiting: reads what the service has
    /// sent, sends what waits, calls the handlers, goes on with connecting anew. Not from two threads at
    /// once. Then, and in any case, returns the events that wait: none if there is an onEvent.
    std::vector<Event> drainEvents();

    /// Waits for the end of a command. With Driver::program a future can be waited for in this way only.
    template <class Ending>
    Ending await(std::future<Ending> ending) {
        driveUntil(
            [&ending] { return ending.wait_for(std::chrono::seconds(0)) == std::future_status::ready; });
        return ending.get();
    }

    /// Connects anew, also to take over again. Throws as the constructor does; then there is no connection.
    /// Without a reconnectLimit all objects have to be made again, events of the old connection that still
    /// wait are dropped, and futures of it that are not ready end as `connectionLost`. With one, all
    /// objects are put back as after a lost connection, and Reconnected tells when. Not from a handler.
    void reconnect();

    /// The connection below, for commands of one's own encoding.
    Connection& connection();

private:
    void driveUntil(const std::function<bool()>& done);

    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

} // namespace tarn::client
