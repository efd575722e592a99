#include "threads/Burst.h"

#include <algorithm>

namespace tarn {

namespace {

thread_local Burst* currentBurst = nullptr;

} // namespace

Burst::Burst() {
    if (currentBurst == nullptr)
        currentBurst = this;
}

Burst::~Burst() {
    if (currentBurst != this)
        return;
    flush();
    currentBurst = nullptr;
}

void Burst::defer(const std::shared_ptr<Deferred>& deferred) {
    if (currentBurst == nullptr) {
        deferred->finishBurst();
        return;
    }
    auto& list = currentBurst->deferred_;
    if (std::find(list.begin(), list.end(), deferred) == list.end())
        list.push_back(deferred);
}

void Burst::flush() {
    if (currentBurst == nullptr)
        return;
    // Finishing may defer again.
    auto& list = currentBurst->deferred_;
    while (!list.empty()) {
        auto deferred = std::move(list.back());
        list.pop_back();
        deferred->finishBurst();
    }
}

} // namespace tarn
