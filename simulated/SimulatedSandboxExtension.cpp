#include "simulated/SimulatedSandboxExtension.h"

#include <algorithm>

namespace tarn {

void SimulatedSandboxExtension::issue(const std::string& token) {
    state_.withLocked([&](State& state) { state.issued.insert(token); });
}

std::int64_t SimulatedSandboxExtension::consume(const char* token) {
    return state_.withLocked([&](State& state) -> std::int64_t {
        if (state.issued.erase(token) == 0)
            return -1;
        state.held.emplace(state.nextHandle, token);
        return state.nextHandle++;
    });
}

void SimulatedSandboxExtension::release(std::int64_t handle) {
    state_.withLocked([&](State& state) { state.held.erase(handle); });
}

bool SimulatedSandboxExtension::holds(const std::string& token) const {
    return state_.withLocked([&](const State& state) {
        return std::any_of(state.held.begin(), state.held.end(),
                           [&](const auto& entry) { return entry.second == token; });
    });
}

std::size_t SimulatedSandboxExtension::held() const {
    return state_.withLocked([](const State& state) { return state.held.size(); });
}

} // namespace tarn
