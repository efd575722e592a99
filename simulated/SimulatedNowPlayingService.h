#pragma once

#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "roles/NowPlayingService.h"

namespace tarn {

/// Keeps every publication, for the scheduler's threads to make and the test to read.
class SimulatedNowPlayingService final : public NowPlayingService {
public:
    struct Publication {
        std::optional<std::string> parentApplication; ///< as it was then
        NowPlayingInfo info;
        int mergePolicy;
    };

    void setParentApplication(Origin, const std::optional<std::string>& applicationIdentifier) override {
        if (auto act = std::exchange(act_, nullptr))
            act();
        parentApplication_ = applicationIdentifier;
    }

    void setNowPlayingInfo(Origin, const NowPlayingInfo& info, int mergePolicy) override {
        publications_.push_back({parentApplication_, info, mergePolicy});
    }

    const std::optional<std::string>& parentApplication() const { return parentApplication_; }
    const std::vector<Publication>& publications() const { return publications_; }

    /// Forgets the publications so far.
    void clear() { publications_.clear(); }

    /// Runs `act` once, in the middle of the next publication, as another thread may come in between.
    void duringNextPublication(std::function<void()> act) { act_ = std::move(act); }

private:
    std::function<void()> act_; // null when nothing is to happen
    std::optional<std::string> parentApplication_;
    std::vector<Publication> publications_;
};

} // namespace tarn
