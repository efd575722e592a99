#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/NowPlayingService.h"

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
        parentApplication_ = applicationIdentifier;
    }

    void setNowPlayingInfo(Origin, const NowPlayingInfo& info, int mergePolicy) override {
        publications_.push_back({parentApplication_, info, mergePolicy});
    }

    const std::optional<std::string>& parentApplication() const { return parentApplication_; }
    const std::vector<Publication>& publications() const { return publications_; }

    /// Forgets the publications so far.
    void clear() { publications_.clear(); }

private:
    std::optional<std::string> parentApplication_;
    std::vector<Publication> publications_;
};

} // namespace tarn
