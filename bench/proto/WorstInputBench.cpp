// What the worst inputs of one frame cost: the time until they are decoded or refused, what the process
// grows by meanwhile, and what of it stays once the message is let go.

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <ctime>
#include <thread>

#include "bench/proto/WorstInputs.h"
#include "bench/support/PeakMemory.h"
#include "proto/VelmoMessage.h"
#include "system/Process.h"

namespace tarn {

namespace {

constexpr double mostMilliseconds = 100;
constexpr double mostMebibytes = 100;
constexpr double mostKeptMebibytes = 2; // what the heap has at hand, however much there was

/// Processor time of this thread, in milliseconds.
double milliseconds() {
    timespec now{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) * 1e3 + static_cast<double>(now.tv_nsec) / 1e6;
}

double mebibytes(long kibibytes) { return static_cast<double>(std::max(kibibytes, 0L)) / 1024; }

/// False when the input costs more than it may.
bool measure(const WorstInput& input) {
    const PeakMemory memory;
    const double begin = milliseconds();
    auto message = VLProtoVelmoMessage::fromDataWithoutPlist(input.bytes);
    const double decoding = milliseconds() - begin;
    const char* const outcome = message ? "decoded" : "refused";
    message.reset();
    const double lettingGo = milliseconds() - begin - decoding;
    const double growth = mebibytes(memory.growth()); // now: asking takes memory, too
    const double kept = mebibytes(memory.kept());

    const bool within = decoding <= mostMilliseconds && growth <= mostMebibytes && kept <= mostKeptMebibytes;
    std::printf("%-42s %s %8.2f %8.2f %8.2f %8.2f  %s\n", input.what.c_str(), outcome, decoding, lettingGo,
                growth, kept, within ? "reached" : "MISSED");
    return within;
}

} // namespace

} // namespace tarn

int main() {
    tarn::returnFreedMemory(); // as the service does
    const auto inputs = tarn::worstInputs();
    std::printf("goals: decoded or refused in %.0f ms, growth %.0f MiB, kept %.0f MiB\n",
                tarn::mostMilliseconds, tarn::mostMebibytes, tarn::mostKeptMebibytes);
    std::printf("%-42s %7s %8s %8s %8s %8s\n", "input of 1 MiB", "", "ms", "free ms", "MiB", "kept MiB");
    // On a thread of its own, as in the service: not all of its memory comes from the heap that can shrink.
    std::thread([&] { std::ranges::for_each(inputs, tarn::measure); }).join();
}
