#pragma once

#include <poll.h>

#include <vector>

#include "player/Poller.h"

namespace tarn {

/// Sleeps until one of a few descriptors is readable.
class SystemPoller final : public Poller {
public:
    void watch(int descriptor, std::function<void()> readable) override;
    bool wait(bool idle) override;

private:
    std::vector<pollfd> descriptors_;
    std::vector<std::function<void()>> calls_; // of the descriptor in the same place
};

} // namespace tarn
