// The functions of <tarn/tarn.h>: each waits for one command of a Client, and lets no exception out.

#include "tarn/tarn.h"

#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <system_error>
#include <utility>

#include "client/libtarn/Overloaded.h"
#include "tarn/Client.h"

using tarn::client::Client;
using tarn::client::Completion;
using tarn::client::Outcome;
using tarn::client::Status;

struct tarn_client {
    explicit tarn_client(Client::Options options) : client(std::move(options)) {}

    Client client;
    tarn::client::Error error; // of the last call that did not succeed
    std::string errorText;
    // What texts that were handed out point into.
    tarn::client::AssetInfo info;
    tarn::client::Event event;
    std::string token;
    std::string reason;
};

namespace {

Client::Options optionsFor(const char* socketPath, int reconnectLimit) {
    Client::Options options;
    if (socketPath != nullptr)
        options.socketPath = socketPath;
    options.driver = tarn::client::Driver::program;
    options.reconnectLimit = std::chrono::milliseconds(reconnectLimit > 0 ? reconnectLimit : 0);
    return options;
}

tarn_result failed(tarn_client* client, tarn_result result, tarn::client::Error error, std::string text) {
    client->error = std::move(error);
    client->errorText = std::move(text);
    return result;
}

tarn_result resultOf(tarn_client* client, const Completion& completion) {
    if (completion.succeeded())
        return TARN_DONE;
    const tarn_result result = completion.outcome == Outcome::connectionLost ? TARN_CONNECTION_LOST
                               : completion.outcome == Outcome::takenOver    ? TARN_TAKEN_OVER
                                                                             : TARN_FAILED;
    return failed(client, result, completion.error, completion.problem());
}

/// What `work` returns, or what becomes of its exception. `given` are all arguments that must not be NULL.
template <class Work>
tarn_result guarded(tarn_client* client, std::initializer_list<const void*> given, Work work) {
    for (const void* argument : given)
        if (client != nullptr && argument == nullptr)
            return failed(client, TARN_INVALID, {"", EINVAL, {}}, "An argument is missing.");
    if (client == nullptr)
        return TARN_INVALID;
    try {
        return work();
    } catch (const std::system_error& error) {
        return failed(client, TARN_FAILED, {"", error.code().value(), {}}, error.what());
    } catch (const std::length_error& error) {
        return failed(client, TARN_INVALID, {"", EMSGSIZE, {}}, error.what());
    } catch (const std::exception& error) {
        return failed(client, TARN_FAILED, {"", ENOMEM, {}}, error.what());
    }
}

template <class Ending>
Ending await(tarn_client* client, std::future<Ending> ending) {
    return client->client.await(std::move(ending));
}

std::optional<std::string> optional(const char* text) {
    return text != nullptr ? std::optional<std::string>(text) : std::nullopt;
}

const char* textOf(const std::optional<std::string>& text) { return text ? text->c_str() : nullptr; }

/// A command about one object.
using One = std::future<Completion> (Client::*)(const std::string&);
tarn_result run(tarn_client* client, One command, const char* object) {
    return guarded(client, {object},
                   [&] { return resultOf(client, await(client, (client->client.*command)(object))); });
}

/// A command about an object and another one.
using Two = std::future<Completion> (Client::*)(const std::string&, const std::string&);
tarn_result run(tarn_client* client, Two command, const char* object, const char* other) {
    return guarded(client, {object, other},
                   [&] { return resultOf(client, await(client, (client->client.*command)(object, other))); });
}

void setStatus(tarn_client* client, tarn_event& event, const Status& status) {
    event.status = static_cast<tarn_status>(status.value);
    if (status.error) {
        client->reason = status.error->summary();
        event.reason = client->reason.c_str();
    }
}

/// `client->event` as C sees it.
tarn_event eventOf(tarn_client* client) {
    using namespace tarn::client;
    tarn_event event{TARN_DISCONNECTED, "", nullptr, 0, TARN_UNKNOWN, nullptr};
    const auto about = [&](tarn_event_kind kind, const std::string& object) {
        event.kind = kind;
        event.object = object.c_str();
    };
    std::visit(
        tarn::Overloaded{
            [&](const ItemStatusChanged& told) {
                about(TARN_ITEM_STATUS_CHANGED, told.item);
                setStatus(client, event, told.status);
            },
            [&](const ItemTimeJumped& told) { about(TARN_ITEM_TIME_JUMPED, told.item); },
            [&](const ItemPlayedToEnd& told) { about(TARN_ITEM_PLAYED_TO_END, told.item); },
            [&](const ItemFailedToPlayToEnd& told) { about(TARN_ITEM_FAILED_TO_PLAY_TO_END, told.item); },
            [&](const PlayerStatusChanged& told) {
                about(TARN_PLAYER_STATUS_CHANGED, told.player);
                setStatus(client, event, told.status);
            },
            [&](const PlayerRateChanged& told) {
                about(TARN_RATE_CHANGED, told.player);
                event.rate = told.rate;
            },
            [&](const CurrentItemChanged& told) {
                about(TARN_CURRENT_ITEM_CHANGED, told.player);
                event.item = textOf(told.item);
            },
            [&](const ConnectionLost&) {}, [&](const Reconnecting&) { event.kind = TARN_RECONNECTING; },
            [&](const Reconnected&) { event.kind = TARN_RECONNECTED; },
            [&](const TakenOver&) { event.kind = TARN_REPLACED; }},
        client->event);
    return event;
}

} // namespace

tarn_client* tarn_connect(const char* socket_path, int reconnect_limit) {
    try {
        return new tarn_client(optionsFor(socket_path, reconnect_limit));
    } catch (const std::system_error& error) {
        errno = error.code().value();
    } catch (const std::exception&) {
        errno = ENOMEM;
    }
    return nullptr;
}

void tarn_close(tarn_client* client) { delete client; }

tarn_result tarn_reconnect(tarn_client* client) {
    return guarded(client, {}, [&] {
        client->client.reconnect();
        return TARN_DONE;
    });
}

const char* tarn_error_text(const tarn_client* client) { return client->errorText.c_str(); }
const char* tarn_error_domain(const tarn_client* client) { return client->error.domain.c_str(); }
int64_t tarn_error_code(const tarn_client* client) { return client->error.code; }

size_t tarn_file_url(const char* path, char* url, size_t size) {
    if (path == nullptr)
        return 0;
    const std::string text = tarn::client::fileURL(path);
    if (text.size() < size)
        std::memcpy(url, text.c_str(), text.size() + 1);
    return text.size();
}

tarn_result tarn_upsert_asset(tarn_client* client, const char* asset, const char* url, const char* title,
                              const char* album_title, const char* artist, const char* token,
                              tarn_asset_info* info) {
    return guarded(client, {asset}, [&] {
        auto ended = await(client, client->client.upsertAsset({.identifier = asset,
                                                               .URL = optional(url),
                                                               .title = optional(title),
                                                               .albumTitle = optional(album_title),
                                                               .artist = optional(artist),
                                                               .sandboxExtensionToken = optional(token)}));
        client->info = std::move(ended.value);
        if (info != nullptr)
            *info = {client->info.duration, textOf(client->info.title), textOf(client->info.albumTitle),
                     textOf(client->info.artist)};
        return resultOf(client, ended);
    });
}

tarn_result tarn_destroy_asset(tarn_client* client, const char* asset) {
    return run(client, &Client::destroyAsset, asset);
}

tarn_result tarn_grant_file(tarn_client* client, const char* path, const char** token) {
    return guarded(client, {path, token}, [&] {
        client->token = client->client.grantFile(path);
        *token = client->token.c_str();
        return TARN_DONE;
    });
}

tarn_result tarn_upsert_item(tarn_client* client, const char* item, const char* asset) {
    return guarded(client, {item, asset},
                   [&] { return resultOf(client, await(client, client->client.upsertItem(item, asset))); });
}

tarn_result tarn_destroy_item(tarn_client* client, const char* item) {
    return run(client, &Client::destroyItem, item);
}

tarn_result tarn_current_time(tarn_client* client, const char* item, double* seconds) {
    return guarded(client, {item, seconds}, [&] {
        const auto ended = await(client, client->client.currentTime(item));
        *seconds = ended.value;
        return resultOf(client, ended);
    });
}

tarn_result tarn_set_current_time(tarn_client* client, const char* item, double seconds) {
    return guarded(client, {item}, [&] {
        return resultOf(client, await(client, client->client.setCurrentTime(item, seconds)));
    });
}

tarn_result tarn_upsert_queue_player(tarn_client* client, const char* player, const char* const* items,
                                     size_t count) {
    return guarded(client, {player, count > 0 ? static_cast<const void*>(items) : player}, [&] {
        const std::vector<std::string> names(items, items + count);
        return resultOf(client, await(client, client->client.upsertQueuePlayer(player, names)));
    });
}

tarn_result tarn_destroy_queue_player(tarn_client* client, const char* player) {
    return run(client, &Client::destroyQueuePlayer, player);
}

tarn_result tarn_set_rate(tarn_client* client, const char* player, float rate) {
    return guarded(client, {player},
                   [&] { return resultOf(client, await(client, client->client.setRate(player, rate))); });
}

tarn_result tarn_advance_to_next_item(tarn_client* client, const char* player) {
    return run(client, &Client::advanceToNextItem, player);
}

tarn_result tarn_append_item(tarn_client* client, const char* player, const char* item) {
    return run(client, &Client::appendItem, player, item);
}

tarn_result tarn_remove_item(tarn_client* client, const char* player, const char* item) {
    return run(client, &Client::removeItem, player, item);
}

tarn_result tarn_remove_all_items(tarn_client* client, const char* player) {
    return run(client, &Client::removeAllItems, player);
}

tarn_result tarn_replace_current_item(tarn_client* client, const char* player, const char* item) {
    return run(client, &Client::replaceCurrentItem, player, item);
}

int tarn_next_event(tarn_client* client, int timeout, tarn_event* event) {
    const tarn_result result = guarded(client, {event}, [&] {
        auto next = timeout < 0 ? client->client.nextEvent()
                                : client->client.nextEvent(std::chrono::milliseconds(timeout));
        if (!next)
            return TARN_FAILED;
        client->event = *std::move(next);
        *event = eventOf(client);
        return TARN_DONE;
    });
    return result == TARN_DONE ? 1 : 0;
}

int tarn_event_descriptor(const tarn_client* client) { return client->client.eventDescriptor(); }
