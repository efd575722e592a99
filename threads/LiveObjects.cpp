#include "threads/LiveObjects.h"

namespace tarn {

namespace {

std::atomic<LiveObjects::Kind*> firstKind{nullptr};

} // namespace

LiveObjects::Kind::Kind(const char* name) : name_(name), next_(firstKind.load()) {
    while (!firstKind.compare_exchange_weak(next_, this)) {
    }
}

std::map<std::string, std::int64_t> LiveObjects::counts() {
    std::map<std::string, std::int64_t> counts;
    for (const Kind* kind = firstKind.load(); kind != nullptr; kind = kind->next_)
        counts[kind->name_] += kind->count_.load();
    return counts;
}

} // namespace tarn
