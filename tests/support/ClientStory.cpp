#include "tests/support/ClientStory.h"

#include "threads/LiveObjects.h"

namespace tarn {

ClientStory::ClientStory() : client(std::make_unique<MirroredClient>(device.roles())) {}

ClientStory::~ClientStory() {
    client.reset();
    device.audioSession.failPending();
    device.scheduler.runUntilIdle();
    for (const auto& [kind, count] : LiveObjects::counts())
        EXPECT_EQ(count, 0) << kind << " left";
}

std::string ClientStory::tell(const commands::Command& command) {
    client->send(command);
    return now();
}

std::string ClientStory::pass(std::chrono::nanoseconds time) {
    device.scheduler.advance(time);
    return client->transcript().take();
}

void ClientStory::song(const std::string& name) {
    std::string URL = "file:///" + name;
    device.media.addFile(URL, {.duration = std::chrono::seconds(10)});
    tell(commands::upsertAsset({.identifier = name, .URL = URL}));
}

void ClientStory::mirror(const std::vector<std::string>& names) {
    for (const std::string& name : names) {
        song(name);
        tell(commands::upsertItem(name, name));
    }
    tell(commands::upsertPlayer("player", names));
}

std::vector<std::string> ClientStory::errors() const {
    std::vector<std::string> errors = log.errors();
    for (std::string& error : errors)
        error.erase(0, error.find(": ") + 2);
    return errors;
}

} // namespace tarn
