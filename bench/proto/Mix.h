#pragma once

#include <vector>

#include "platform/Data.h"

namespace tarn {

/// Encoded messages as a service sees them, in a fixed random order, 56 bytes each on average.
///
/// Of 1,000 messages: a client mirrors its library (asset and item upserts, appended items, destroyed
/// objects), asks for the time twice as often as anything else happens, and now and then sets rate and
/// position; the service answers and reports what plays. Assets and items are named by UUIDs, queue players
/// by a name and the identifier of the client's extension.
struct Mix {
    Mix();

    std::vector<Data> envelopes;     // commands and events
    std::vector<Data> statuses;      // answers to item and queue player upserts
    std::vector<Data> assetMetaData; // answers to asset upserts
    std::vector<Data> currentTimes;  // answers to time queries
};

/// One envelope: a queue player with that many items, each named by a UUID.
Data queueOfItems(unsigned count);

} // namespace tarn
