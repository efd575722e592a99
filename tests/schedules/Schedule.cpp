#include "tests/schedules/Schedule.h"

#include <chrono>
#include <utility>

namespace tarn {

namespace {

using namespace std::chrono_literals;

} // namespace

const std::vector<Schedule::Row> Schedule::rows{
    {60, &Schedule::command},       {12, &Schedule::passTime},   {8, &Schedule::linger},
    {6, &Schedule::scriptSession},  {4, &Schedule::interrupt},   {4, &Schedule::pressKey},
    {1, &Schedule::breakSound},     {1, &Schedule::sendGarbage}, {2, &Schedule::connect},
    {2, &Schedule::loseConnection},
};

Schedule::Schedule(std::uint64_t seed)
    : platform_(seed),
      mix_([this](std::size_t limit) { return random(limit); },
           {"file:///good", "file:///long", "file:///tagged", "file:///short", "file:///broken",
            "file:///unplayable", "file:///stalling", "file:///slow", "file:///missing"}),
      service_(std::make_shared<VLLongFormAudioServer>(platform_.roles())) {
    addFiles();
}

void Schedule::addFiles() {
    auto add = [this](const char* URL, MediaScript script) {
        platform_.media.addFile(URL, std::move(script));
    };
    add("file:///good", {.duration = 4s});
    add("file:///long", {.duration = 60s});
    add("file:///tagged", {.title = "Song", .albumTitle = "Album", .artist = "Band", .duration = 3s});
    add("file:///short", {.duration = 20ms});
    add("file:///broken", {.duration = 4s, .breaksAt = 1s});
    add("file:///unplayable", {.unplayable = Error{"test", 1, {}}});
    add("file:///stalling", {.duration = 4s, .stalls = {{1s, 3s}}});
    add("file:///slow", {.duration = 4s, .readyAfter = 2s});
}

std::vector<std::string> Schedule::run() {
    service_->run();
    connect();
    for (std::size_t steps = 40 + random(80); steps > 0; --steps)
        step();
    // A client that stays until nothing happens any more must have been answered.
    platform_.audioSession.failPending();
    platform_.scheduler.runUntilIdle();
    std::vector<std::string> wrong = violations();
    for (Connection& connection : connections_)
        connection.client->hangUp();
    platform_.scheduler.runUntilIdle();
    return wrong;
}

std::vector<std::string> Schedule::violations() {
    std::vector<std::string> all = wrong_;
    for (std::size_t index = 0; index < connections_.size(); ++index)
        for (const std::string& violation :
             connections_[index].checks.violations(connections_[index].client->deliveries()))
            all.push_back("client " + std::to_string(index) + ", " + violation);
    return all;
}

void Schedule::step() {
    std::size_t total = 0;
    for (const Row& row : rows)
        total += row.weight;
    std::size_t place = random(total);
    auto row = rows.begin();
    while (place >= row->weight)
        place -= (row++)->weight;
    (this->*row->happen)();
}

void Schedule::send(const commands::Command& command) {
    auto& [client, checks] = connections_.back();
    if (client->connection().isLost())
        return;
    std::size_t before = client->deliveries().size();
    if (random(8) == 0)
        client->send(commands::encoded(command));
    else
        checks.sent(client->call(commands::encoded(command)), command, before);
}

void Schedule::passTime() {
    static constexpr std::chrono::nanoseconds times[] = {1ms, 20ms, 500ms, 1s, 2s, 5s, 17s, 30s};
    platform_.scheduler.advance(times[random(std::size(times))]);
}

void Schedule::scriptSession() {
    static const SimulatedAudioSession::Activation activations[] = {
        {.after = 300ms},
        {.after = 20s},
        {.never = true},
        {.twice = true},
        {.error = Error{"test", 2, {}}},
        {.after = 18s, .error = Error{"test", 3, {}}},
    };
    platform_.audioSession.willActivate(activations[random(std::size(activations))]);
}

void Schedule::interrupt() {
    if (random(2) == 0)
        platform_.audioSession.beginInterruption();
    else
        platform_.audioSession.endInterruption(random(3) == 0 ? std::nullopt
                                                              : std::optional<std::uint64_t>(random(3)));
}

void Schedule::pressKey() { platform_.remoteCommands.press(static_cast<RemoteCommandKind>(random(5))); }

void Schedule::breakSound() {
    if (random(2) == 0)
        platform_.media.speaker().reset();
    else
        platform_.media.speaker().loseDevice();
}

void Schedule::sendGarbage() { connections_.back().client->send({0x12, 0x7f, 0x01}); }

void Schedule::connect() {
    for (Connection& connection : connections_)
        connection.checks.mayBeReplacedFrom(connection.client->deliveries().size());
    connections_.push_back({std::make_unique<SimulatedClient>(platform_.listeners), {}});
    if (random(4) == 0)
        return;
    for (const auto& command : mix_.beginning())
        send(command);
}

/// Sometimes an old one that has been replaced: its loss ends the current one too.
void Schedule::loseConnection() {
    for (Connection& connection : connections_)
        connection.checks.mayBeReplacedFrom(connection.client->deliveries().size());
    SimulatedClient& client = *connections_[random(connections_.size())].client;
    if (random(2) == 0)
        client.hangUp();
    else
        client.breakOff();
    if (random(3) != 0)
        connect();
    else
        expectSilence();
}

/// Without a client nothing sounds, whatever the work of those that were there still waits for.
void Schedule::expectSilence() {
    platform_.scheduler.runReady();
    if (service_->clientConnection() == nullptr && platform_.media.speaker().soundingOutputs() > 0)
        wrong_.emplace_back("a client that left still sounds");
}

} // namespace tarn
