#pragma once

#include <gtest/gtest.h>

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "simulated/SimulatedPlatform.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/ClientCommands.h"
#include "tests/support/MirroredClient.h"

namespace tarn {

/// Stories of one client on a simulated device: what the client sends and what happens to the device goes in,
/// the lines that the client sees come out.
///
/// At the end the client goes, and no object of it may be left.
class ClientStory : public testing::Test {
protected:
    ClientStory();
    ~ClientStory() override;

    /// Sends a command and lets happen what can happen before time moves; what the client then has seen since
    /// the last call of one of these.
    std::string tell(const commands::Command& command);
    std::string pass(std::chrono::nanoseconds time);
    std::string now() { return pass(std::chrono::nanoseconds(0)); }

    /// A file of ten seconds, and an asset of it.
    void song(const std::string& name);

    /// Makes an asset of a file, an item of each asset, and a queue player "player" of the items, all by the
    /// names given. Nobody looks at what the client saw meanwhile.
    void mirror(const std::vector<std::string>& names);

    /// The error lines without the method and line number that they begin with.
    std::vector<std::string> errors() const;

    SimulatedPlatform device{1};
    CapturedLog log;
    std::unique_ptr<MirroredClient> client;
};

} // namespace tarn
