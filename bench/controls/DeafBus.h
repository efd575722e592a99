#pragma once

#include <string>

#include "system/FileDescriptor.h"

namespace tarn {

/// Stands where a bus was and hangs up on everyone who connects.
class DeafBus final {
public:
    /// `path` of its socket, which is replaced.
    explicit DeafBus(const std::string& path);

    /// Waits for the next one who tries, and hangs up; false when nobody did for ten seconds.
    [[nodiscard]] bool refuseOne();

private:
    FileDescriptor socket_;
};

} // namespace tarn
