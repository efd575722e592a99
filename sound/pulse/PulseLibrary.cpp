#include "sound/pulse/PulseLibrary.h"

#include <pulse/mainloop.h>

#include <utility>

#include "sound/pulse/PulseConnection.h"

namespace tarn {

void PulseLibrary::MainLoopDelete::operator()(pa_mainloop* loop) const { pa_mainloop_free(loop); }

PulseLibrary::PulseLibrary() : mainLoop_(pa_mainloop_new()) {}

PulseLibrary::~PulseLibrary() = default;

void PulseLibrary::watch(int descriptor, std::function<void()> readable) {
    calls_.push_back(std::make_unique<std::function<void()>>(std::move(readable)));
    pa_mainloop_api& events = *pa_mainloop_get_api(mainLoop_.get());
    events.io_new(
        &events, descriptor, PA_IO_EVENT_INPUT,
        [](pa_mainloop_api*, pa_io_event*, int, pa_io_event_flags_t, void* call) {
            (*static_cast<std::function<void()>*>(call))();
        },
        calls_.back().get());
}

bool PulseLibrary::wait(bool idle) {
    pa_mainloop* loop = mainLoop_.get();
    return pa_mainloop_prepare(loop, idle ? -1 : 0) >= 0 && pa_mainloop_poll(loop) >= 0 &&
           pa_mainloop_dispatch(loop) >= 0;
}

std::unique_ptr<SoundConnection> PulseLibrary::connect(SoundConnectionListener& listener) {
    return std::make_unique<PulseConnection>(*pa_mainloop_get_api(mainLoop_.get()), listener);
}

} // namespace tarn
