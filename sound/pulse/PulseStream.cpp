#include "sound/pulse/PulseStream.h"

#include <pulse/pulseaudio.h>
#include <sys/time.h>

#include <algorithm>
#include <cstring>
#include <utility>

#include "sound/pulse/PulseFormat.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr char restoreKey[] = "module-stream-restore.id";
constexpr char restoreId[] = "sink-input-by-application-id:ostrel.tarnd";
constexpr std::int64_t longestSilence = 60; // seconds; more is no count but "unknown"
constexpr std::uint32_t whatever = static_cast<std::uint32_t>(-1);

struct Properties {
    pa_proplist* list = pa_proplist_new();
    Properties() = default;
    Properties(const Properties&) = delete;
    Properties& operator=(const Properties&) = delete;
    ~Properties() { pa_proplist_free(list); }
    void set(const char* key, const std::string& value) const { pa_proplist_sets(list, key, value.c_str()); }
};

void letGo(pa_operation* operation) {
    if (operation != nullptr)
        pa_operation_unref(operation);
}

// The device itself holds only a small part of the buffer, so that what is heard can be changed soon.
pa_buffer_attr bufferOf(const PcmFormat& format, std::size_t frames) {
    const auto bytes = static_cast<std::uint32_t>(frames * format.bytesPerFrame());
    const auto deviceBytes = static_cast<std::uint32_t>(format.rate / 10 * format.bytesPerFrame());
    return {whatever, bytes, 0, (bytes - deviceBytes) / 2, whatever};
}

std::chrono::nanoseconds ageOf(const timeval& wallTime) {
    timeval now{};
    gettimeofday(&now, nullptr);
    const auto age = std::chrono::seconds(now.tv_sec - wallTime.tv_sec) +
                     std::chrono::microseconds(now.tv_usec - wallTime.tv_usec);
    return std::clamp<std::chrono::nanoseconds>(age, 0s, 1s); // the wall clock may be set
}

} // namespace

/// What the server tells of all streams, on the way to the question whether a call holds ours back.
struct PulseStream::CallSurvey {
    std::weak_ptr<PulseStream*> stream;
    std::uint32_t index;
    bool muted = false;
    bool call = false;
};

struct PulseStream::Callbacks {
    static PulseStream& self(void* data) { return *static_cast<PulseStream*>(data); }

    static void stateChanged(pa_stream* stream, void* data) {
        const pa_stream_state_t state = pa_stream_get_state(stream);
        if (state == PA_STREAM_READY) {
            self(data).ready_ = true;
            self(data).device_ = pa_stream_get_device_index(stream);
            self(data).listener_.streamReady();
            self(data).askForCalls();
        } else if (!PA_STREAM_IS_GOOD(state) &&
                   PA_CONTEXT_IS_GOOD(pa_context_get_state(pa_stream_get_context(stream)))) {
            self(data).listener_.streamKilled();
        }
    }

    static void event(pa_stream*, const char* name, pa_proplist*, void* data) {
        if (std::strcmp(name, PA_STREAM_EVENT_REQUEST_CORK) == 0)
            self(data).listener_.streamToBeInterrupted();
        else if (std::strcmp(name, PA_STREAM_EVENT_REQUEST_UNCORK) == 0)
            self(data).listener_.streamToBeReleased();
    }

    static void moved(pa_stream*, void* data) { self(data).checkOldDevice(); }

    static void oldDevice(pa_context*, const pa_sink_info*, int end, void* data) {
        auto* weak = static_cast<std::weak_ptr<PulseStream*>*>(data);
        if (end == 0)
            return;
        const auto stream = weak->lock();
        delete weak;
        if (stream && end < 0) // the server knows no such device any more
            (*stream)->listener_.streamMovedOffVanishedDevice();
    }

    static void otherStream(pa_context*, const pa_sink_input_info* info, int end, void* data) {
        auto* survey = static_cast<CallSurvey*>(data);
        if (end == 0) {
            const char* role = pa_proplist_gets(info->proplist, PA_PROP_MEDIA_ROLE);
            survey->muted |= info->index == survey->index && info->mute != 0;
            survey->call |= role != nullptr && std::strcmp(role, "phone") == 0;
            return;
        }
        const auto stream = survey->stream.lock();
        if (stream && survey->muted && survey->call)
            (*stream)->listener_.streamToBeInterrupted();
        delete survey;
    }

    static void timing(pa_stream*, int success, void* data) {
        if (success != 0)
            self(data).listener_.streamTimingUpdated();
    }
};

void PulseStream::StreamDelete::operator()(pa_stream* stream) const {
    pa_stream_set_state_callback(stream, nullptr, nullptr);
    pa_stream_set_event_callback(stream, nullptr, nullptr);
    pa_stream_set_moved_callback(stream, nullptr, nullptr);
    pa_stream_disconnect(stream);
    pa_stream_unref(stream);
}

void PulseStream::OperationDelete::operator()(pa_operation* operation) const {
    pa_operation_cancel(operation);
    pa_operation_unref(operation);
}

PulseStream::PulseStream(pa_context* context, const PcmFormat& format, std::size_t bufferFrames,
                         SoundStreamListener& listener)
    : format_(format), listener_(listener), self_(std::make_shared<PulseStream*>(this)) {
    const Properties properties;
    properties.set(PA_PROP_MEDIA_ROLE, "music");
    properties.set(PA_PROP_MEDIA_ICON_NAME, "audio-x-generic");
    properties.set(restoreKey, restoreId); // our own volume, not that of everything that plays music
    const pa_sample_spec spec = specOf(format);
    const pa_channel_map map = channelMapOf(format);
    stream_.reset(pa_stream_new_with_proplist(context, "Playback", &spec, &map, properties.list));
    pa_stream_set_state_callback(stream_.get(), Callbacks::stateChanged, this);
    pa_stream_set_event_callback(stream_.get(), Callbacks::event, this);
    pa_stream_set_moved_callback(stream_.get(), Callbacks::moved, this);
    const pa_buffer_attr buffer = bufferOf(format, bufferFrames);
    pa_stream_connect_playback(stream_.get(), nullptr, &buffer, PA_STREAM_START_CORKED, nullptr, nullptr);
}

PulseStream::~PulseStream() = default;

void PulseStream::cork(bool stopped) {
    letGo(pa_stream_cork(stream_.get(), stopped ? 1 : 0, nullptr, nullptr));
}

void PulseStream::write(const std::byte* data, std::size_t frames, std::int64_t offset, int seek) {
    const auto size = static_cast<std::int64_t>(format_.bytesPerFrame());
    pa_stream_write(stream_.get(), data, frames * format_.bytesPerFrame(), nullptr, offset * size,
                    static_cast<pa_seek_mode_t>(seek));
}

void PulseStream::write(const std::byte* data, std::size_t frames) {
    write(data, frames, 0, PA_SEEK_RELATIVE);
}

void PulseStream::writeAt(std::int64_t frame, const std::byte* data, std::size_t frames) {
    write(data, frames, frame, PA_SEEK_ABSOLUTE);
}

void PulseStream::writeSoon(std::size_t margin, const std::byte* data, std::size_t frames) {
    write(data, frames, static_cast<std::int64_t>(margin), PA_SEEK_RELATIVE_ON_READ);
}

void PulseStream::updateTiming() {
    timingQuery_.reset(pa_stream_update_timing_info(stream_.get(), Callbacks::timing, this));
}

std::optional<PulseStream::Timing> PulseStream::timing() const {
    const pa_timing_info* info = pa_stream_get_timing_info(stream_.get());
    if (info == nullptr || info->write_index_corrupt != 0 || info->read_index_corrupt != 0)
        return std::nullopt;
    const auto size = static_cast<std::int64_t>(format_.bytesPerFrame());
    Timing timing;
    timing.writeIndex = info->write_index / size;
    timing.readIndex = info->read_index / size;
    timing.latency = std::chrono::microseconds(info->sink_usec);
    timing.time = std::chrono::steady_clock::now().time_since_epoch() - ageOf(info->timestamp);
    const bool ranDry = info->playing == 0 && info->read_index > 0 && info->read_index >= info->write_index;
    timing.playing = info->playing != 0 || ranDry;
    if (ranDry && info->since_underrun < longestSilence * format_.rate * size)
        timing.silence = static_cast<std::int64_t>(info->since_underrun) / size;
    return timing;
}

// The server moves a stream when it is told to, and when it has to.
void PulseStream::checkOldDevice() {
    const std::uint32_t before = std::exchange(device_, pa_stream_get_device_index(stream_.get()));
    auto* weak = new std::weak_ptr<PulseStream*>(self_); // oldDevice() owns it
    pa_operation* operation = pa_context_get_sink_info_by_index(pa_stream_get_context(stream_.get()), before,
                                                                Callbacks::oldDevice, weak);
    if (operation == nullptr)
        delete weak;
    letGo(operation);
}

/// A stream that is made during a call is muted at once, and the server's request comes before the stream can
/// hear it: only the end of the call will be told.
void PulseStream::askForCalls() {
    auto* survey = new CallSurvey{self_, pa_stream_get_index(stream_.get())}; // otherStream() owns it
    pa_operation* operation = pa_context_get_sink_input_info_list(pa_stream_get_context(stream_.get()),
                                                                  Callbacks::otherStream, survey);
    if (operation == nullptr)
        delete survey;
    letGo(operation);
}

void PulseStream::setDescription(const std::string& title, const std::string& artist) {
    const Properties properties;
    properties.set(PA_PROP_MEDIA_NAME, title.empty() ? "Playback" : title);
    properties.set(PA_PROP_MEDIA_TITLE, title);
    properties.set(PA_PROP_MEDIA_ARTIST, artist);
    letGo(pa_stream_proplist_update(stream_.get(), PA_UPDATE_REPLACE, properties.list, nullptr, nullptr));
}

} // namespace tarn
