#pragma once

#include <map>
#include <optional>
#include <string>
#include <utility>

#include "roles/ApplicationRegistry.h"

namespace tarn {

/// The applications that the test has installed.
class SimulatedApplicationRegistry final : public ApplicationRegistry {
public:
    void install(std::string extensionIdentifier, std::string applicationIdentifier) {
        applications_.insert_or_assign(std::move(extensionIdentifier), std::move(applicationIdentifier));
    }

    std::optional<std::string>
    applicationContainingExtension(const std::string& extensionIdentifier) override {
        auto found = applications_.find(extensionIdentifier);
        return found == applications_.end() ? std::nullopt : std::optional(found->second);
    }

private:
    std::map<std::string, std::string> applications_;
};

} // namespace tarn
