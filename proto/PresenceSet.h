#pragma once

#include <cstdint>

namespace tarn {

/// Which optional scalars of a message are present, by field number (below 16).
class PresenceSet {
public:
    bool operator[](unsigned fieldNumber) const { return (bits_ >> fieldNumber & 1U) != 0; }

    void set(unsigned fieldNumber, bool present = true) {
        const unsigned bit = 1U << fieldNumber;
        bits_ = static_cast<std::uint16_t>(present ? bits_ | bit : bits_ & ~bit);
    }

private:
    std::uint16_t bits_ = 0;
};

} // namespace tarn
