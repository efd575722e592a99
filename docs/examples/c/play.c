/* Plays a file through the service.
 *
 *     cc play.c $(pkg-config --cflags --libs libtarn) -o play && ./play song.flac
 */
#include <stdio.h>

#include <tarn/tarn.h>

static const char player[] = "player,org.example.Play";

static int play(tarn_client* client, const char* path) {
    char url[4096];
    const char* items[] = {"item"};
    tarn_asset_info info;
    tarn_event event;

    if (tarn_file_url(path, url, sizeof url) >= sizeof url)
        return 1;
    if (tarn_upsert_asset(client, "song", url, NULL, NULL, NULL, NULL, &info) != TARN_DONE)
        return 1;
    printf("%.2f s\n", info.duration);
    if (tarn_upsert_item(client, "item", "song") != TARN_DONE ||
        tarn_upsert_queue_player(client, player, items, 1) != TARN_DONE ||
        tarn_set_rate(client, player, 1) != TARN_DONE)
        return 1;
    while (tarn_next_event(client, -1, &event))
        if (event.kind == TARN_ITEM_PLAYED_TO_END)
            return 0;
        else if (event.kind == TARN_ITEM_FAILED_TO_PLAY_TO_END)
            return 1;
    return 1;
}

int main(int argc, char** argv) {
    tarn_client* client;
    int failed;

    if (argc != 2) {
        fprintf(stderr, "usage: play FILE\n");
        return 2;
    }
    client = tarn_connect(NULL, 30000);
    if (client == NULL) {
        perror("tarnd");
        return 1;
    }
    failed = play(client, argv[1]);
    if (failed)
        fprintf(stderr, "%s\n", tarn_error_text(client));
    tarn_close(client);
    return failed;
}
