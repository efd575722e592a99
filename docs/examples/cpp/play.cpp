// Plays the file that is given and waits for its end.
#include <iostream>
#include <variant>

#include <tarn/Client.h>

int main(int argc, char** argv) {
    if (argc != 2) {
        std::cerr << "usage: play FILE\n";
        return 2;
    }
    tarn::client::Client client;
    const auto asset =
        client.upsertAsset({.identifier = "file", .URL = tarn::client::fileURL(argv[1])}).get();
    if (!asset.succeeded()) {
        std::cerr << asset.problem() << "\n";
        return 1;
    }
    std::cout << asset.value.title.value_or(argv[1]) << ", " << asset.value.duration << " s\n";
    client.upsertItem("item", "file").get();
    client.upsertQueuePlayer("player,org.example.Play", {"item"}).get();
    client.setRate("player,org.example.Play", 1);
    while (const auto event = client.nextEvent()) {
        if (std::holds_alternative<tarn::client::ItemPlayedToEnd>(*event))
            return 0;
        if (std::holds_alternative<tarn::client::ItemFailedToPlayToEnd>(*event))
            break;
    }
    return 1;
}
