#include "bench/sound/PulseThread.h"

#include <cstdint>
#include <cstring>
#include <stdexcept>
#include <vector>

#include <pulse/proplist.h>

namespace tarn {

PulseThread::PulseThread() : loop_(pa_threaded_mainloop_new()) {
    context_ = pa_context_new(pa_threaded_mainloop_get_api(loop_), "bench");
    const auto changed = [](pa_context*, void* thread) { static_cast<PulseThread*>(thread)->signal(); };
    pa_context_set_state_callback(context_, changed, this);
    pa_context_connect(context_, nullptr, PA_CONTEXT_NOAUTOSPAWN, nullptr);
    pa_threaded_mainloop_start(loop_);
    locked([this] {
        wait([this] {
            return !PA_CONTEXT_IS_GOOD(pa_context_get_state(context_)) ||
                   pa_context_get_state(context_) == PA_CONTEXT_READY;
        });
    });
    if (pa_context_get_state(context_) != PA_CONTEXT_READY)
        throw std::runtime_error("no sound server");
}

PulseThread::~PulseThread() {
    pa_threaded_mainloop_stop(loop_);
    pa_context_disconnect(context_);
    pa_context_unref(context_);
    pa_threaded_mainloop_free(loop_);
}

void PulseThread::locked(const std::function<void()>& work) {
    pa_threaded_mainloop_lock(loop_);
    work();
    pa_threaded_mainloop_unlock(loop_);
}

void PulseThread::wait(const std::function<bool()>& done) {
    while (!done())
        pa_threaded_mainloop_wait(loop_);
}

PulsePlayer::PulsePlayer(PulseThread& thread, Kind kind) : thread_(thread), kind_(kind) {
    thread_.locked([this] {
        const pa_sample_spec spec{PA_SAMPLE_S16NE, 44100, 2};
        const pa_buffer_attr buffer{static_cast<std::uint32_t>(-1), 2 * 44100 * 4,
                                    static_cast<std::uint32_t>(-1), static_cast<std::uint32_t>(-1),
                                    static_cast<std::uint32_t>(-1)};
        pa_proplist* properties = pa_proplist_new();
        pa_proplist_sets(properties, PA_PROP_MEDIA_ROLE, kind_ == Kind::call ? "phone" : "music");
        stream_ = pa_stream_new_with_proplist(thread_.context(), "bench", &spec, nullptr, properties);
        pa_proplist_free(properties);
        pa_stream_set_state_callback(stream_, tell, this);
        pa_stream_set_write_callback(stream_, fill, this);
        if (kind_ == Kind::music)
            pa_stream_set_event_callback(stream_, obey, this);
        pa_stream_connect_playback(stream_, "out", &buffer, PA_STREAM_NOFLAGS, nullptr, nullptr);
        thread_.wait([this] { return pa_stream_get_state(stream_) != PA_STREAM_CREATING; });
    });
}

PulsePlayer::~PulsePlayer() {
    thread_.locked([this] {
        pa_stream_set_write_callback(stream_, nullptr, nullptr);
        pa_stream_set_event_callback(stream_, nullptr, nullptr);
        pa_stream_disconnect(stream_);
        thread_.wait([this] { return !PA_STREAM_IS_GOOD(pa_stream_get_state(stream_)); });
        pa_stream_set_state_callback(stream_, nullptr, nullptr);
        pa_stream_unref(stream_);
    });
}

void PulsePlayer::tell(pa_stream*, void* player) { static_cast<PulsePlayer*>(player)->thread_.signal(); }

void PulsePlayer::fill(pa_stream* stream, std::size_t size, void* player) {
    const bool sounds = static_cast<PulsePlayer*>(player)->kind_ == Kind::music;
    const std::vector<std::int16_t> samples(size / sizeof(std::int16_t), sounds ? 1000 : 0);
    pa_stream_write(stream, samples.data(), samples.size() * sizeof(std::int16_t), nullptr, 0,
                    PA_SEEK_RELATIVE);
}

void PulsePlayer::obey(pa_stream* stream, const char* event, pa_proplist*, void*) {
    const bool cork = std::strcmp(event, PA_STREAM_EVENT_REQUEST_CORK) == 0;
    if (cork || std::strcmp(event, PA_STREAM_EVENT_REQUEST_UNCORK) == 0)
        pa_operation_unref(pa_stream_cork(stream, cork ? 1 : 0, nullptr, nullptr));
}

} // namespace tarn
