#pragma once

#include <optional>
#include <string>
#include <variant>

#include <tarn/Answer.h>

namespace tarn::client {

/// How an item or a queue player is.
struct Status {
    enum class Value { unknown = 0, readyToPlay = 1, failed = 2 };

    Value value = Value::unknown;
    std::optional<Error> error{};            ///< why it failed
    std::optional<std::string> identifier{}; ///< in the answer to a queue player's upsert: its current item
};

/// The service tells what happens without being asked. `item` and `player` are the program's identifiers.
struct ItemStatusChanged {
    std::string item;
    Status status;
};
struct ItemTimeJumped {
    std::string item;
};
struct ItemPlayedToEnd {
    std::string item;
};
struct ItemFailedToPlayToEnd {
    std::string item;
};
struct PlayerStatusChanged {
    std::string player;
    Status status;
};
struct PlayerRateChanged {
    std::string player;
    float rate = 0; ///< 1 is as recorded, 0 is paused, below 0 plays backwards
};
struct CurrentItemChanged {
    std::string player;
    std::optional<std::string> item; ///< none when the queue is empty
};

// The events that follow are about the connection, and not from the service. See Client about when they come.

/// The connection ended, or the service has forgotten all objects, and nothing is done about it (any more).
/// Nothing else follows before Client::reconnect().
struct ConnectionLost {};
/// The same, but the client is about to connect anew and to put its objects back. Nothing sounds meanwhile.
struct Reconnecting {};
/// The client is connected again and its objects are back. Events follow that tell how they differ from
/// what was told before Reconnecting.
struct Reconnected {};
/// Another program has connected to the service, which has forgotten this client's objects.
/// Nothing else follows before Client::reconnect().
struct TakenOver {};

using Event = std::variant<ItemStatusChanged, ItemTimeJumped, ItemPlayedToEnd, ItemFailedToPlayToEnd,
                           PlayerStatusChanged, PlayerRateChanged, CurrentItemChanged, ConnectionLost,
                           Reconnecting, Reconnected, TakenOver>;

/// One line for a log, such as "a: played to its end". Not for a person to read, and not translated.
std::string describe(const Event& event);

} // namespace tarn::client
