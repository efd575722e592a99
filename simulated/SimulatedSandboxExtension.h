#pragma once

#include <cstdint>
#include <map>
#include <set>
#include <string>

#include "roles/SandboxExtension.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// Tokens that the test hands out, and who holds the rights they gave.
class SimulatedSandboxExtension final : public SandboxExtension {
public:
    /// From now on `token` can be consumed, once.
    void issue(const std::string& token);

    std::int64_t consume(const char* token) override;
    void release(std::int64_t handle) override;

    /// Has the token been consumed and not released yet?
    bool holds(const std::string& token) const;

    /// Handles that have not been released.
    std::size_t held() const;

private:
    struct State {
        std::set<std::string> issued;
        std::map<std::int64_t, std::string> held;
        std::int64_t nextHandle = 0;
    };

    MutexProtected<State> state_;
};

} // namespace tarn
