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
    std::optional<Error> error;            ///< why it failed
    std::optional<std::string> identifier; ///< in the answer to a queue player's upsert: its current item
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
/// Not from the service: the connection ended. All objects are gone.
struct ConnectionLost {};

using Event = std::variant<ItemStatusChanged, ItemTimeJumped, ItemPlayedToEnd, ItemFailedToPlayToEnd,
                           PlayerStatusChanged, PlayerRateChanged, CurrentItemChanged, ConnectionLost>;

} // namespace tarn::client
