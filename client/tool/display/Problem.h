#pragma once

#include <stdexcept>
#include <string>

namespace tarn::tool {

/// Ends the tool: what went wrong, what the person can do about it, and the exit status. Thrown where nothing
/// can go on, and caught in main() alone.
class Problem : public std::runtime_error {
public:
    Problem(const std::string& what, std::string advice, int exitStatus = 1)
        : std::runtime_error(what), advice_(std::move(advice)), exitStatus_(exitStatus) {}

    const std::string& advice() const { return advice_; }
    int exitStatus() const { return exitStatus_; }

private:
    std::string advice_;
    int exitStatus_;
};

} // namespace tarn::tool
