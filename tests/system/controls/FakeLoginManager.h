#pragma once

#include <memory>
#include <string>
#include <vector>

namespace tarn {

/// The part of a login manager that deals with sleep, on a bus of the test's own.
class FakeLoginManager final {
public:
    explicit FakeLoginManager(const std::string& address);
    ~FakeLoginManager();

    /// Waits until exactly these locks are held, as "what:mode" in alphabetical order.
    [[nodiscard]] bool waitForLocks(const std::vector<std::string>& locks);

    void prepareForSleep(bool beginning);

private:
    class Implementation;

    std::unique_ptr<Implementation> implementation_;
};

} // namespace tarn
