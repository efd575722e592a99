#pragma once

#include <vector>

#include "roles/Data.h"

namespace tarn {

/// Encoded messages as a service sees them, in a fixed random order, 73 bytes each on average.
///
/// Of 1,000 messages: a client mirrors 90 tracks (an asset and an item upsert each, with an answer to either
/// and the item's first status) and lets 50 go again; fills 12 queue players with ten items each and appends
/// 70 items to them; asks for the time 70 times; sets a rate 40 times and a position 24 times, and skips 10
/// items. The service reports, beside what was said, 10 items that failed, and for each play a rate, a
/// current item, an end or a jump. Every command that has an answer is there with it. Assets and items are
/// named by UUIDs, queue players by a name and the identifier of the client's extension.
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
