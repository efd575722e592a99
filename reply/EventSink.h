#pragma once

#include "roles/Data.h"

namespace tarn {

/// Takes the events that are pushed to the client. The service implements it.
class EventSink {
public:
    virtual ~EventSink() = default;

    /// From any thread; never blocks. `data` is one serialized envelope; it is dropped while no client is
    /// connected.
    virtual void sendData(const Data& data) = 0;
};

} // namespace tarn
