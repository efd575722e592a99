// How much the service costs over the least that any service on a socket costs: its round trips beside those
// of a bare echo and of an echo that hands its bytes through as many threads; and what it takes to be there.

#include <sched.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <fstream>
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

constexpr int roundTrips = 20'000;
constexpr int pipelined = 200'000;
constexpr int ahead = 64;
constexpr int rounds = 5;
constexpr int starts = 20;
constexpr std::chrono::seconds idleTime{10};

/// A command goes from the I/O thread to a worker.
constexpr int handOffs = 1;

struct Figures {
    double median = 1e9; // microseconds; of the round with the least
    double p99 = 1e9;
    double rate = 0; // a second, with a write for each call; of the round with the most
    double rateOfManyInOneWrite = 0;
};

void pinToOneProcessor() {
    cpu_set_t allowed;
    CPU_ZERO(&allowed);
    CPU_SET(static_cast<std::size_t>(std::max(0, ::sched_getcpu())), &allowed);
    ::sched_setaffinity(0, sizeof(allowed), &allowed);
}

void measure(FrameClient& client, Figures& figures) {
    const auto times = client.roundTrips(roundTrips);
    figures.median = std::min(figures.median, Microseconds(times[times.size() / 2]).count());
    figures.p99 = std::min(figures.p99, Microseconds(times[times.size() * 99 / 100]).count());
    figures.rate = std::max(figures.rate, client.rate(pipelined, ahead, FrameClient::Writes::ofEachCall));
    figures.rateOfManyInOneWrite = std::max(figures.rateOfManyInOneWrite,
                                            client.rate(pipelined, ahead, FrameClient::Writes::ofAllAtOnce));
}

Data callOf(const Envelope& envelope) {
    Data call;
    appendFrame(call, FrameKind::call, 1, envelope->serialize());
    return call;
}

template <class Message>
std::shared_ptr<Message> named(const char* identifier) {
    auto message = std::make_shared<Message>();
    message->setIdentifier(identifier);
    return message;
}

/// A second of silence.
void writeSong(const std::string& path) {
    constexpr unsigned char header[] = {'R', 'I', 'F',  'F',  0x64, 0x3E, 0,    0,    'W',  'A', 'V',
                                        'E', 'f', 'm',  't',  ' ',  16,   0,    0,    0,    1,   0,
                                        1,   0,   0x40, 0x1F, 0,    0,    0x80, 0x3E, 0,    0,   2,
                                        0,   16,  0,    'd',  'a',  't',  'a',  0x80, 0x3E, 0,   0};
    std::ofstream song(path, std::ios::binary);
    song.write(reinterpret_cast<const char*>(header), sizeof(header));
    song << std::string(16'000, '\0');
}

/// A client of the service whose call asks for the position of an item.
FrameClient positionClient(const ServiceProcess& service) {
    const auto song = (service.folder() / "song.wav").string();
    writeSong(song);
    auto asset = named<VLProtoAudioFilePlayerAssetUpdateMetaData>("a");
    asset->setURL("file://" + song);
    auto item = named<VLProtoAudioFilePlayerUpdateContainedIdentifier>("a");
    item->setContainedIdentifier("a");

    // Each waits for its answer, for items are made beside assets.
    auto socket = service.connect();
    for (const auto& envelope : {velmoMessage(asset), velmoMessageForPlayerItemUpsertWithAsset(item)}) {
        FrameClient setUp(FileDescriptor(::dup(socket.get())), callOf(envelope), Sender::service);
        setUp.roundTrips(1);
    }
    return {std::move(socket),
            callOf(velmoMessageForPlayerItemGetCurrentTime(named<VLProtoObjectMessage>("a"))),
            Sender::service};
}

void printRatio(const char* what, double value, double goal, bool atMost) {
    std::printf("  %-58s %6.2f   (goal: %s %.2f)%s\n", what, value, atMost ? "at most" : "at least", goal,
                (atMost ? value <= goal : value >= goal) ? "" : "   MISSED");
}

void benchRoundTrips() {
    const ServiceProcess process;
    auto service = positionClient(process);
    const auto call = callOf(velmoMessageForPlayerItemGetCurrentTime(named<VLProtoObjectMessage>("a")));
    const Echo bareProcess(0);
    const Echo threadsProcess(handOffs);
    FrameClient bare(FileDescriptor(bareProcess.socket()), call, Sender::client);
    FrameClient threads(FileDescriptor(threadsProcess.socket()), call, Sender::client);

    Figures ofService;
    Figures ofBare;
    Figures ofThreads;
    for (int i = 0; i < rounds; ++i) {
        measure(bare, ofBare);
        measure(threads, ofThreads);
        measure(service, ofService);
    }
    std::printf(
        "round trips on one processor, best of %d rounds  median us  p99 us  64 in flight/s  the same, "
        "many in one write\n",
        rounds);
    const auto print = [](const char* name, const Figures& figures) {
        std::printf("  %-44s %10.2f %7.2f %15.0f %15.0f\n", name, figures.median, figures.p99, figures.rate,
                    figures.rateOfManyInOneWrite);
    };
    print("bare echo", ofBare);
    print("echo through another thread", ofThreads);
    print("position query", ofService);
    printRatio("median over the bare echo's", ofService.median / ofBare.median, 2.5, true);
    printRatio("99th percentile over the bare echo's median", ofService.p99 / ofBare.median, 4, true);
    printRatio("rate with 64 in flight over the bare echo's", ofService.rate / ofBare.rate, 0.4, false);
    std::printf("  %-58s %6.2f\n", "the same when the client gathers calls in one write",
                ofService.rateOfManyInOneWrite / ofBare.rateOfManyInOneWrite);
    printRatio("median over the echo's with as many hand-offs", ofService.median / ofThreads.median, 1.5,
               true);
}

void benchBeingThere() {
    std::vector<double> times;
    times.reserve(starts);
    for (int i = 0; i < starts; ++i)
        times.push_back(Milliseconds(ServiceProcess().startTime()).count());
    std::sort(times.begin(), times.end());
    std::printf("being there\n");
    printRatio("start to ready, ms, median", times[times.size() / 2], 15, true);

    const ServiceProcess service;
    const auto megabytes = [&] { return static_cast<double>(service.memory()) / 1024; };
    printRatio("proportional set size before the first client, MiB", megabytes(), 6, true);
    {
        auto client = positionClient(service);
        client.roundTrips(1);
    }
    // Measured from a state that it stays in: the last client has gone.
    const auto settled = std::chrono::steady_clock::now() + std::chrono::seconds(1);
    std::this_thread::sleep_until(settled);
    const long before = service.wakeups();
    std::this_thread::sleep_until(settled + idleTime);
    printRatio("wakeups in ten idle seconds", static_cast<double>(service.wakeups() - before), 0, true);
    std::printf("  %-58s %6.2f\n", "proportional set size after a client that opened a file", megabytes());
}

} // namespace

int main() {
    benchBeingThere();
    pinToOneProcessor();
    benchRoundTrips();
}
