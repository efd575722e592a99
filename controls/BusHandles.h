#pragma once

#include <memory>

#include <systemd/sd-bus.h>
#include <systemd/sd-event.h>

namespace tarn {

/// Owning pointers to what the bus library counts itself. None of them may be shared between threads.
template <auto release>
struct Release {
    void operator()(auto* handle) const { release(handle); }
};

using EventHandle = std::unique_ptr<sd_event, Release<sd_event_unref>>;
using EventSourceHandle = std::unique_ptr<sd_event_source, Release<sd_event_source_disable_unref>>;
using BusHandle = std::unique_ptr<sd_bus, Release<sd_bus_close_unref>>; // drops what was not sent yet
using SlotHandle = std::unique_ptr<sd_bus_slot, Release<sd_bus_slot_unref>>;
using MessageHandle = std::unique_ptr<sd_bus_message, Release<sd_bus_message_unref>>;

} // namespace tarn
