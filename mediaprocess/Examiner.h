#pragma once

#include "mediaprotocol/Channel.h"
#include "mediaprotocol/Parking.h"

namespace tarn {

/// Tells the service what files say of themselves, one after the other. To be run locked down.
class Examiner {
public:
    /// `locks` are told with every answer.
    Examiner(Channel service, std::uint32_t locks) : service_(std::move(service)), locks_(locks) {}

    /// Returns when the service wants no more, or has wanted nothing for as long as the channel waits.
    void run();

private:
    void examine(ParkedFile file, bool mayHang);

    const Channel service_;
    const std::uint32_t locks_;
};

} // namespace tarn
