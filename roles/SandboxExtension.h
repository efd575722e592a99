#pragma once

#include <cstdint>

namespace tarn {

/// Rights to single files that a client hands over as tokens. Any thread may call.
class SandboxExtension {
public:
    virtual ~SandboxExtension() = default;

    /// Takes a NUL-terminated token. The handle (zero or above) makes the token's file open with the client's
    /// rights until it is released; -1 when the token is unknown or spent.
    virtual std::int64_t consume(const char* token) = 0;
    virtual void release(std::int64_t handle) = 0;
};

} // namespace tarn
