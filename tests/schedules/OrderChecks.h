#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>
#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "simulated/SimulatedConnection.h"
#include "tests/support/ClientCommands.h"

namespace tarn {

/// What a client may never see, whatever the schedule: checks what came on one connection against what was
/// sent on it.
class OrderChecks {
public:
    /// `deliveriesBefore` is how many deliveries the connection had when the call was sent.
    void sent(std::uint64_t call, const commands::Command& command, std::size_t deliveriesBefore);

    /// From this delivery on, the connection may not be the current one any more: its commands may be
    /// cancelled, and its objects' events go elsewhere.
    void mayBeReplacedFrom(std::size_t delivery);

    /// To be called when nothing can happen any more. One line for everything that is wrong.
    std::vector<std::string> violations(const std::vector<SimulatedDelivery>& deliveries) const;

private:
    class Review;

    struct Call {
        commands::Command command;
        std::size_t deliveriesBefore;
    };

    std::map<std::uint64_t, Call> calls_;
    std::size_t replacedFrom_ = std::numeric_limits<std::size_t>::max();
};

} // namespace tarn
