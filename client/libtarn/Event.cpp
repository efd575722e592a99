#include "tarn/Event.h"

#include <sstream>

#include "client/libtarn/Overloaded.h"

namespace tarn::client {

namespace {

std::string describe(const Status& status) {
    switch (status.value) {
    case Status::Value::unknown:
        return "not opened yet";
    case Status::Value::readyToPlay:
        return "ready to play";
    case Status::Value::failed:
        return status.error ? "failed: " + status.error->summary() : "failed";
    }
    return "a status of a later version";
}

std::string describeRate(float rate) {
    std::ostringstream text;
    text.imbue(std::locale::classic());
    text << "rate " << rate;
    return text.str();
}

} // namespace

std::string describe(const Event& event) {
    return std::visit(
        Overloaded{
            [](const ItemStatusChanged& it) { return it.item + ": " + describe(it.status); },
            [](const ItemTimeJumped& it) { return it.item + ": the position was moved"; },
            [](const ItemPlayedToEnd& it) { return it.item + ": played to its end"; },
            [](const ItemFailedToPlayToEnd& it) { return it.item + ": failed to play to its end"; },
            [](const PlayerStatusChanged& it) { return it.player + ": " + describe(it.status); },
            [](const PlayerRateChanged& it) { return it.player + ": " + describeRate(it.rate); },
            [](const CurrentItemChanged& it) {
                return it.player + ": now " + (it.item ? *it.item : std::string("nothing"));
            },
            [](const ConnectionLost&) { return std::string("connection lost"); },
            [](const Reconnecting&) { return std::string("reconnecting"); },
            [](const Reconnected&) { return std::string("reconnected"); },
            [](const TakenOver&) { return std::string("taken over"); },
        },
        event);
}

} // namespace tarn::client
