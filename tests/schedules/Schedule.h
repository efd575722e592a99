#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "service/LongFormAudioServer.h"
#include "simulated/SimulatedClient.h"
#include "simulated/SimulatedPlatform.h"
#include "tests/schedules/CommandMix.h"
#include "tests/schedules/OrderChecks.h"

namespace tarn {

/// One life of the whole service as a seed has it: clients that come, go and command, interruptions, media
/// keys, a session that is late or fails, sound that breaks off, and time, in any order and interleaving.
class Schedule {
public:
    explicit Schedule(std::uint64_t seed);

    /// Runs it to the last client's end. One line for everything that was wrong.
    std::vector<std::string> run();

private:
    /// A client and what is to be said about it at the end.
    struct Connection {
        std::unique_ptr<SimulatedClient> client;
        OrderChecks checks;
    };

    struct Row {
        std::size_t weight;
        void (Schedule::*happen)();
    };
    static const std::vector<Row> rows;

    std::size_t random(std::size_t limit) { return platform_.scheduler.random(limit); }
    void addFiles();
    void step();

    void send(const commands::Command& command);
    void command() { send(mix_.next()); }
    void passTime();
    void linger() { platform_.scheduler.runReady(); }
    void scriptSession();
    void interrupt();
    void pressKey();
    void breakSound();
    void sendGarbage();
    void connect();
    void loseConnection();
    void expectSilence();

    std::vector<std::string> violations();

    SimulatedPlatform platform_;
    CommandMix mix_;
    std::shared_ptr<VLLongFormAudioServer> service_;
    std::vector<Connection> connections_; // the last one is current, if it has not been lost
    std::vector<std::string> wrong_;
};

} // namespace tarn
