// What the service costs: its round trips, its processor time and its memory.
//
// bench_ipc               beside the least that any service on a socket costs: a bare echo, and an echo that
//                         passes what comes to another thread, as the service must
// bench_ipc PROGRAM BASE  beside another build of the service, for a change that must not make it slower
//
// The sides take turns in short rounds, because what else the machine does then meets all of them alike. A
// ratio is taken within a round; shown are the median of all rounds and the quarters around it.

#include <sched.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "bench/ipc/Echo.h"
#include "bench/ipc/FrameClient.h"
#include "bench/ipc/ServiceProcess.h"
#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"

namespace {

using namespace tarn;
using namespace tarn::bench;
using Sender = FrameReader::Sender;
using Microseconds = std::chrono::duration<double, std::micro>;
using Milliseconds = std::chrono::duration<double, std::milli>;

constexpr int rounds = 15;
constexpr int roundTrips = 5'000;
constexpr int pipelined = 50'000;
constexpr int ahead = 64;
constexpr int startsInARound = 4;
constexpr int tracks = 1'000;
constexpr std::chrono::seconds idleTime{10};

double middle(std::vector<double> values, double part = 0.5) {
    std::sort(values.begin(), values.end());
    return values[static_cast<std::size_t>(part * static_cast<double>(values.size() - 1) + 0.5)];
}

/// One figure of several sides, in rounds; the last side is what the others are compared with.
struct Row {
    std::string name;
    std::vector<std::function<double()>> sides;
    std::vector<std::vector<double>> values = std::vector<std::vector<double>>(sides.size());

    void measure() {
        for (std::size_t side = 0; side < sides.size(); ++side)
            values[side].push_back(sides[side]());
    }

    void print() const {
        std::printf("%-34s", name.c_str());
        for (const auto& ofSide : values)
            std::printf(" %12.2f", middle(ofSide));
        for (std::size_t side = 0; side + 1 < sides.size(); ++side) {
            std::vector<double> ratios;
            for (std::size_t round = 0; round < values[side].size(); ++round)
                ratios.push_back(values[side][round] / values.back()[round]);
            std::printf("   %.3f (%.3f to %.3f)", middle(ratios), middle(ratios, 0.25), middle(ratios, 0.75));
        }
        std::printf("\n");
    }
};

void measureInTurn(std::vector<Row> rows, int times) {
    for (int round = 0; round < times; ++round)
        for (auto& row : rows)
            row.measure();
    for (const auto& row : rows)
        row.print();
}

Data callOf(const Envelope& envelope) {
    Data call;
    appendFrame(call, FrameKind::call, 1, envelope->serialize());
    return call;
}

template <class Message>
std::shared_ptr<Message> named(const std::string& identifier) {
    auto message = std::make_shared<Message>();
    message->setIdentifier(identifier);
    return message;
}

/// A second of silence.
std::string writeSong(const ServiceProcess& service) {
    constexpr unsigned char header[] = {'R', 'I', 'F',  'F',  0x64, 0x3E, 0,    0,    'W',  'A', 'V',
                                        'E', 'f', 'm',  't',  ' ',  16,   0,    0,    0,    1,   0,
                                        1,   0,   0x40, 0x1F, 0,    0,    0x80, 0x3E, 0,    0,   2,
                                        0,   16,  0,    'd',  'a',  't',  'a',  0x80, 0x3E, 0,   0};
    auto path = (service.folder() / "song.wav").string();
    std::ofstream song(path, std::ios::binary);
    song.write(reinterpret_cast<const char*>(header), sizeof(header));
    song << std::string(16'000, '\0');
    return path;
}

/// Makes an asset and an item of each name, waiting for each answer: items are made beside assets.
void mirror(const FileDescriptor& socket, const std::string& song, const std::vector<std::string>& names) {
    for (const auto& name : names) {
        auto asset = named<VLProtoAudioFilePlayerAssetUpdateMetaData>(name);
        asset->setURL("file://" + song);
        auto item = named<VLProtoAudioFilePlayerUpdateContainedIdentifier>(name);
        item->setContainedIdentifier(name);
        for (const auto& envelope : {velmoMessage(asset), velmoMessageForPlayerItemUpsertWithAsset(item)})
            FrameClient(FileDescriptor(::dup(socket.get())), callOf(envelope), Sender::service).roundTrips(1);
    }
}

const Data& positionQuery() {
    static const Data call =
        callOf(velmoMessageForPlayerItemGetCurrentTime(named<VLProtoObjectMessage>("a")));
    return call;
}

/// A client of the service whose call asks for the position of an item.
FrameClient positionClient(const ServiceProcess& service) {
    auto socket = service.connect();
    mirror(socket, writeSong(service), {"a"});
    return {std::move(socket), positionQuery(), Sender::service};
}

void pinToOneProcessor() {
    cpu_set_t allowed;
    CPU_ZERO(&allowed);
    CPU_SET(static_cast<std::size_t>(std::max(0, ::sched_getcpu())), &allowed);
    ::sched_setaffinity(0, sizeof(allowed), &allowed);
}

/// The rows that a client sees, of whatever stands at the other end.
std::vector<Row> rowsOf(const std::vector<FrameClient*>& clients) {
    using Times = std::vector<std::chrono::nanoseconds>;
    const auto row = [&](const char* name, const std::function<double(FrameClient&)>& figure) {
        Row made{name, {}};
        for (auto* client : clients)
            made.sides.push_back([client, figure] { return figure(*client); });
        made.values.resize(clients.size());
        return made;
    };
    const auto at = [](double part, const Times& times) {
        return Microseconds(times[static_cast<std::size_t>(static_cast<double>(times.size()) * part)])
            .count();
    };
    return {row("round trip, us", [at](auto& client) { return at(0.5, client.roundTrips(roundTrips)); }),
            row("round trip, 99th percentile, us",
                [at](auto& client) { return at(0.99, client.roundTrips(roundTrips)); }),
            row("64 in flight, us each",
                [](auto& client) {
                    return 1e6 / client.rate(pipelined, ahead, FrameClient::Writes::ofEachCall);
                }),
            row("the same, many in one write", [](auto& client) {
                return 1e6 / client.rate(pipelined, ahead, FrameClient::Writes::ofAllAtOnce);
            })};
}

/// The rows that take a look into the process, too.
std::vector<Row> rowsOf(const std::vector<std::unique_ptr<ServiceProcess>>& services,
                        const std::vector<FrameClient*>& clients) {
    Row inTurn{"processor time of a query, us", {}};
    Row inFlight{"the same with 64 in flight, us", {}};
    for (std::size_t side = 0; side < services.size(); ++side) {
        const auto used = [&service = *services[side]](int queries, auto&& ask) {
            const auto before = service.processorTime();
            ask();
            return Microseconds(service.processorTime() - before).count() / queries;
        };
        inTurn.sides.push_back([used, client = clients[side]] {
            return used(roundTrips, [&] { client->roundTrips(roundTrips); });
        });
        inFlight.sides.push_back([used, client = clients[side]] {
            return used(pipelined, [&] { client->rate(pipelined, ahead, FrameClient::Writes::ofEachCall); });
        });
    }
    inTurn.values.resize(services.size());
    inFlight.values.resize(services.size());
    return {inTurn, inFlight};
}

double millisecondsToStart(const std::string& program) {
    std::vector<double> times;
    for (int i = 0; i < startsInARound; ++i)
        times.push_back(Milliseconds(ServiceProcess(program).startTime()).count());
    return middle(times);
}

double kilobytesOfATrack(const std::string& program) {
    const ServiceProcess service(program);
    const auto socket = service.connect();
    const auto song = writeSong(service);
    mirror(socket, song, {"first"}); // loads what is loaded once
    const long before = service.anonymousMemory();
    std::vector<std::string> names;
    for (int i = 0; i < tracks; ++i)
        names.push_back("track " + std::to_string(i));
    mirror(socket, song, names);
    return static_cast<double>(service.anonymousMemory() - before) / tracks;
}

void compareServices(const std::vector<std::string>& programs) {
    Row start{"start to ready, ms", {}};
    Row memory{"memory before the first client, KiB", {}};
    Row ofTrack{"memory of a track, KiB", {}};
    for (const auto& program : programs) {
        start.sides.push_back([program] { return millisecondsToStart(program); });
        memory.sides.push_back([program] { return static_cast<double>(ServiceProcess(program).memory()); });
        ofTrack.sides.push_back([program] { return kilobytesOfATrack(program); });
    }
    for (Row* row : {&start, &memory, &ofTrack})
        row->values.resize(programs.size());
    measureInTurn({start, memory}, rounds);
    if (programs.size() > 1)
        measureInTurn({ofTrack}, 3);

    pinToOneProcessor();
    std::vector<std::unique_ptr<ServiceProcess>> services;
    std::vector<FrameClient> ofServices;
    std::vector<FrameClient*> clients;
    for (const auto& program : programs)
        ofServices.push_back(
            positionClient(*services.emplace_back(std::make_unique<ServiceProcess>(program))));
    for (auto& client : ofServices)
        clients.push_back(&client);
    auto rows = rowsOf(services, clients);
    if (programs.size() > 1)
        std::ranges::move(rowsOf(clients), std::back_inserter(rows));
    measureInTurn(std::move(rows), rounds);
}

void compareWithFloors() {
    const ServiceProcess process;
    const Echo bareProcess(0);
    const Echo threadsProcess(1);
    auto service = positionClient(process);
    FrameClient bare(FileDescriptor(bareProcess.socket()), positionQuery(), Sender::client);
    FrameClient threads(FileDescriptor(threadsProcess.socket()), positionQuery(), Sender::client);
    std::printf("%-34s %12s %12s %12s   service over echo\n", "", "service", "by a thread", "bare echo");
    measureInTurn(rowsOf({&service, &threads, &bare}), rounds);
    std::printf("goals over the bare echo: round trip 2.5, 64 in flight 2.5\n");
}

/// Measured from a state that it stays in: the last client has gone.
void watchIdle() {
    const ServiceProcess service;
    positionClient(service).roundTrips(1);
    const auto settled = std::chrono::steady_clock::now() + std::chrono::seconds(1);
    std::this_thread::sleep_until(settled);
    const long before = service.wakeups();
    std::this_thread::sleep_until(settled + idleTime);
    std::printf("%-34s %12ld   (goal: 0)\n", "wake-ups in ten idle seconds", service.wakeups() - before);
    std::printf("%-34s %12ld\n", "memory after a client, KiB", service.memory());
}

} // namespace

int main(int argc, char** argv) {
    if (argc == 3) {
        std::printf("%-34s %12s %12s   ratio\n", "", "program", "base");
        compareServices({argv[1], argv[2]});
        return 0;
    }
    compareServices({TARND});
    watchIdle();
    compareWithFloors();
}
