/* Plays audio files through the service tarnd: libtarn for C, and for every language that can call C.
 *
 * A program makes assets of files, items of assets and queue players of items, each under an identifier of
 * its choosing, and follows the events. The last component of a queue player's identifier, split at commas,
 * names the program to the system's media controls: "music,org.example.Player". <tarn/Client.h> says more
 * about all of it; what follows is the same, for one thread.
 *
 * Threads: a client is used by one thread at a time. Its calls wait until the command has ended, and the
 * library makes no thread of its own.
 *
 * Texts are UTF-8. Those given are copied; NULL stands for none where that is said. Those returned belong to
 * the client and are good until the next call with it.
 *
 * After a fork() a child may only close its copy, which leaves the parent's connection alone.
 */
#ifndef TARN_TARN_H
#define TARN_TARN_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* NOLINTBEGIN(modernize-use-using): this is C. */

typedef struct tarn_client tarn_client;

/* How a call ended. What is said of it beyond that: tarn_error_text(), tarn_error_domain(),
 * tarn_error_code(). */
typedef enum tarn_result {
    TARN_DONE = 0,
    TARN_FAILED = 1,          /* the service, or the system, says why */
    TARN_CONNECTION_LOST = 2, /* whether the command was carried out is not known */
    TARN_TAKEN_OVER = 3,      /* not carried out: another program has taken over the service */
    TARN_INVALID = 4          /* nothing was sent: an argument is NULL that must not be, or too long */
} tarn_result;

/* Connects to `socket_path`, or where the service is by default if that is NULL. NULL with errno when nobody
 * listens, access is denied, or who listens belongs to another user (EPERM).
 *
 * With a `reconnect_limit` above 0, in milliseconds, a crash or an update of the service costs a short
 * silence: the library connects anew for so long, and puts all objects back with their positions, queues and
 * rates. It does so inside of calls. */
tarn_client* tarn_connect(const char* socket_path, int reconnect_limit);

/* Ends the connection. NULL is nothing. */
void tarn_close(tarn_client* client);

/* Connects anew, also to take over again. Without a reconnect_limit all objects have to be made again. */
tarn_result tarn_reconnect(tarn_client* client);

/* Of the last call that did not succeed: one line for a person, never NULL; whose code it is, "" when it is
 * not the service's; and the code, which then is an errno. */
const char* tarn_error_text(const tarn_client* client);
const char* tarn_error_domain(const tarn_client* client);
int64_t tarn_error_code(const tarn_client* client);

/* Writes the URL of a file, with a final zero, to `url`, if it fits into `size` bytes. Returns its length; 0
 * when `path` is NULL. A relative path is taken from the current folder. */
size_t tarn_file_url(const char* path, char* url, size_t size);

/* Assets. */

typedef struct tarn_asset_info {
    double duration; /* seconds */
    const char* title;
    const char* album_title;
    const char* artist; /* each may be NULL */
} tarn_asset_info;

/* Makes or replaces an asset. Without a `url` only the texts are changed. Texts that are NULL are read from
 * the file. `token` is one of tarn_grant_file(), or NULL. `info` gets what the file says of itself, and may
 * be NULL. */
tarn_result tarn_upsert_asset(tarn_client* client, const char* asset, const char* url, const char* title,
                              const char* album_title, const char* artist, const char* token,
                              tarn_asset_info* info);
tarn_result tarn_destroy_asset(tarn_client* client, const char* asset);

/* Opens a file and hands it to the service, which may be unable to open it itself. `token` gets the token for
 * the asset with this file's URL; it is good once. */
tarn_result tarn_grant_file(tarn_client* client, const char* path, const char** token);

/* Items. */

tarn_result tarn_upsert_item(tarn_client* client, const char* item, const char* asset);
tarn_result tarn_destroy_item(tarn_client* client, const char* item);
/* The position that is heard, in seconds. */
tarn_result tarn_current_time(tarn_client* client, const char* item, double* seconds);
/* Moves the position, to within 1/60 s; beyond the end is the end. */
tarn_result tarn_set_current_time(tarn_client* client, const char* item, double seconds);

/* Queue players. */

/* Makes or replaces a queue player of `count` items, paused. */
tarn_result tarn_upsert_queue_player(tarn_client* client, const char* player, const char* const* items,
                                     size_t count);
tarn_result tarn_destroy_queue_player(tarn_client* client, const char* player);
/* 1 plays as recorded, 0 pauses, below 0 plays backwards. TARN_RATE_CHANGED tells when it is so. */
tarn_result tarn_set_rate(tarn_client* client, const char* player, float rate);
tarn_result tarn_advance_to_next_item(tarn_client* client, const char* player);
tarn_result tarn_append_item(tarn_client* client, const char* player, const char* item);
tarn_result tarn_remove_item(tarn_client* client, const char* player, const char* item);
tarn_result tarn_remove_all_items(tarn_client* client, const char* player);
tarn_result tarn_replace_current_item(tarn_client* client, const char* player, const char* item);

/* Events. A later version may have more kinds: pass over what you do not know. */

typedef enum tarn_event_kind {
    TARN_ITEM_STATUS_CHANGED = 0,
    TARN_ITEM_TIME_JUMPED = 1,
    TARN_ITEM_PLAYED_TO_END = 2,
    TARN_ITEM_FAILED_TO_PLAY_TO_END = 3,
    TARN_PLAYER_STATUS_CHANGED = 4,
    TARN_RATE_CHANGED = 5,
    TARN_CURRENT_ITEM_CHANGED = 6,
    TARN_DISCONNECTED = 7, /* nothing follows before tarn_reconnect() */
    TARN_RECONNECTING = 8,
    TARN_RECONNECTED = 9,
    TARN_REPLACED = 10 /* another program has taken over; nothing follows before tarn_reconnect() */
} tarn_event_kind;

typedef enum tarn_status { TARN_UNKNOWN = 0, TARN_READY_TO_PLAY = 1, TARN_CANNOT_PLAY = 2 } tarn_status;

typedef struct tarn_event {
    tarn_event_kind kind;
    const char*
        object;       /* the item or the queue player that it is about; "" when it is about the connection */
    const char* item; /* of TARN_CURRENT_ITEM_CHANGED: NULL when the queue is empty */
    float rate;       /* of TARN_RATE_CHANGED */
    tarn_status status; /* of the two that change a status */
    const char* reason; /* why it failed, or why a queue player is not heard; NULL when neither is so */
} tarn_event;

/* Waits for the next event, `timeout` milliseconds at most, for ever when it is negative. 1 when there was
 * one; 0 when the time passed, or when there is no connection and all was told. */
int tarn_next_event(tarn_client* client, int timeout, tarn_event* event);

/* For a main loop: readable whenever tarn_next_event() has something to do. Not to be read from. */
int tarn_event_descriptor(const tarn_client* client);

/* NOLINTEND(modernize-use-using) */

#ifdef __cplusplus
}
#endif

#endif
