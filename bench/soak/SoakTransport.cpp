// What must hold for as long as the service runs: no command is lost, repeated or out of order, nothing grows
// with the number of clients, and one that dies or does not read costs the others nothing.   usage:
// soak_transport [SHARE]

#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <string>

#include <tarn/Client.h>

#include "bench/ipc/ServiceProcess.h"
#include "ipc/Frame.h"
#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"

namespace {

using namespace tarn;
using namespace tarn::bench;
using client::Client;
using client::Outcome;
using SteadyTime = std::chrono::steady_clock;

bool allHeld = true;

void report(bool holds, const std::string& what) {
    std::printf("%-7s %s\n", holds ? "held" : "FAILED", what.c_str());
    std::fflush(stdout);
    allHeld = allHeld && holds;
}

double secondsSince(SteadyTime::time_point begin) {
    return std::chrono::duration<double>(SteadyTime::now() - begin).count();
}

client::Connection::Handlers silent() { return {nullptr, nullptr}; }

std::string socketOf(const ServiceProcess& service) { return (service.folder() / "ostrel.tarnd").string(); }

bool isServed(Client& client) { return client.destroyAsset("none").get().outcome == Outcome::released; }

client::Bytes destroyCommand() {
    auto asset = std::make_shared<VLProtoObjectMessage>();
    asset->setIdentifier("none");
    return velmoMessageForAssetDestroy(std::move(asset))->serialize();
}

/// Their ends come in the order of the commands, each once.
void pipelineCommands(const ServiceProcess& service, int count) {
    std::mutex mutex;
    std::condition_variable changed;
    int ended = 0;
    int wrong = 0;
    client::Connection connection(silent(), socketOf(service));
    const auto command = destroyCommand();
    const auto begin = SteadyTime::now();
    for (int i = 0; i < count; ++i)
        connection.call(command, [&, i](const client::Answer& answer) {
            std::lock_guard lock(mutex);
            if (answer.outcome != Outcome::released || i != ended)
                ++wrong;
            if (++ended == count)
                changed.notify_all();
        });
    std::unique_lock lock(mutex);
    const bool all = changed.wait_for(lock, std::chrono::minutes(10), [&] { return ended == count; });
    report(all && wrong == 0, std::to_string(count) + " commands sent ahead: " + std::to_string(ended) +
                                  " ended, " + std::to_string(wrong) + " wrong or out of order, " +
                                  std::to_string(static_cast<long>(count / secondsSince(begin))) + "/s");
}

void replaceConnections(const ServiceProcess& service, int count) {
    constexpr int settled = 1'000;
    Client client({.socketPath = socketOf(service)});
    long memory = 0;
    std::size_t files = 0;
    std::size_t threads = 0;
    int unserved = 0;
    const auto begin = SteadyTime::now();
    for (int i = 0; i < count; ++i) {
        if (i == std::min(settled, count / 2)) {
            memory = service.residentMemory();
            files = service.openFiles();
            threads = service.threads();
        }
        client.reconnect();
        unserved += isServed(client) ? 0 : 1;
    }
    const long growth = service.residentMemory() - memory;
    report(unserved == 0, std::to_string(count) + " replacements: " + std::to_string(unserved) +
                              " not served, " +
                              std::to_string(static_cast<long>(count / secondsSince(begin))) + "/s");
    report(growth <= 1'024, "growth of resident memory: " + std::to_string(growth) + " KiB");
    report(service.openFiles() <= files && service.threads() <= threads,
           "files " + std::to_string(files) + " -> " + std::to_string(service.openFiles()) + ", threads " +
               std::to_string(threads) + " -> " + std::to_string(service.threads()));
}

void killClients(const ServiceProcess& service, int count) {
    Data calls;
    for (std::uint64_t id = 1; id <= 20; ++id)
        appendFrame(calls, FrameKind::call, id, destroyCommand());
    int unserved = 0;
    for (int i = 0; i < count; ++i) {
        // A plain fork: nothing of this process runs in the child but what stands here.
        const pid_t child = ::fork();
        if (child == 0) {
            const auto socket = service.connect();
            [[maybe_unused]] const auto sent = ::send(socket.get(), calls.data(), calls.size(), MSG_NOSIGNAL);
            ::kill(::getpid(), SIGKILL);
        }
        ::waitpid(child, nullptr, 0);
        Client client({.socketPath = socketOf(service)});
        unserved += isServed(client) ? 0 : 1;
    }
    report(unserved == 0, std::to_string(count) + " killed clients: " + std::to_string(unserved) +
                              " of those that came next not served");
}

/// Asks and does not read, until it is cut off. The service overflows on a call that the socket took, so it
/// took no longer to cut the client off than from the last of these on.
void ignoreAnswers(const ServiceProcess& service) {
    auto item = std::make_shared<VLProtoObjectMessage>();
    item->setIdentifier(std::string(1'000, 'i'));
    Data call;
    appendFrame(call, FrameKind::call, 1,
                velmoMessageForPlayerItemGetCurrentTime(std::move(item))->serialize());
    const long before = service.residentMemory();
    const auto begin = SteadyTime::now();
    auto lastTaken = begin;
    {
        const auto socket = service.connect();
        while (::send(socket.get(), call.data(), call.size(), MSG_NOSIGNAL) > 0)
            lastTaken = SteadyTime::now();
    }
    const double toCutOff = secondsSince(lastTaken);
    const double seconds = std::chrono::duration<double>(lastTaken - begin).count();
    Client next({.socketPath = socketOf(service)});
    const long growth = service.residentMemory() - before;
    report(toCutOff <= 1 && growth <= 8'192 && isServed(next),
           "a client that does not read: overflows after " + std::to_string(seconds) + " s, cut off within " +
               std::to_string(toCutOff) + " s of it, growth " + std::to_string(growth) +
               " KiB, the next is served");
}

} // namespace

int main(int argc, char** argv) {
    const int share = argc > 1 ? std::max(1, std::atoi(argv[1])) : 1;
    const ServiceProcess service;
    pipelineCommands(service, 1'000'000 / share);
    replaceConnections(service, 100'000 / share);
    killClients(service, 10'000 / share);
    ignoreAnswers(service);
    return allHeld ? EXIT_SUCCESS : EXIT_FAILURE;
}
