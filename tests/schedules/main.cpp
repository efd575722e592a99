// Runs seeded schedules of the whole service on the simulated platform; each seed is one interleaving, and
// the same one again.   usage: test_schedules [first seed] [how many]

#include <chrono>
#include <cstdio>
#include <cstdlib>

#include "log/SystemLog.h"
#include "tests/schedules/Schedule.h"
#include "threads/LiveObjects.h"

namespace {

/// What goes wrong in a schedule is logged a thousand times as it should be.
class NoSink final : public tarn::LogSink {
public:
    void write(const tarn::LogRecord&) override {}
};

bool runSeed(std::uint64_t seed) {
    std::vector<std::string> wrong = tarn::Schedule(seed).run();
    for (const auto& [kind, live] : tarn::LiveObjects::counts())
        if (live != 0)
            wrong.push_back(std::to_string(live) + " objects of the kind \"" + kind + "\" are left");
    for (const std::string& line : wrong)
        std::printf("seed %llu: %s\n", static_cast<unsigned long long>(seed), line.c_str());
    return wrong.empty();
}

} // namespace

int main(int argc, char** argv) {
    std::uint64_t first = argc > 1 ? std::strtoull(argv[1], nullptr, 10) : 1;
    std::uint64_t count = argc > 2 ? std::strtoull(argv[2], nullptr, 10) : 2000;
    tarn::SystemLog::setSink(std::make_shared<NoSink>());
    auto begin = std::chrono::steady_clock::now();
    std::uint64_t failures = 0;
    for (std::uint64_t seed = first; seed < first + count && failures < 10; ++seed)
        failures += runSeed(seed) ? 0 : 1;
    std::chrono::duration<double> took = std::chrono::steady_clock::now() - begin;
    std::printf("%llu schedules in %.1f s, %llu failed\n", static_cast<unsigned long long>(count),
                took.count(), static_cast<unsigned long long>(failures));
    return failures == 0 ? EXIT_SUCCESS : EXIT_FAILURE;
}
