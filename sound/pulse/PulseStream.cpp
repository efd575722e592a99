#include "sound/pulse/PulseStream.h"

#include <pulse/pulseaudio.h>
#include <sys/time.h>

#include <algorithm>
#include <cstring>
#include <utility>

#include "sound/pulse/PulseFormat.h"
#include "sound/pulse/PulseSurvey.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr std::size_t bufferSeconds = 2;
constexpr std::size_t mostBytes = 3U << 20;           // a server takes four mebibytes at most
constexpr std::chrono::milliseconds deepLatency{500}; // of what a device takes at a time
constexpr std::chrono::milliseconds shallowLatency{25};
constexpr std::size_t requestsPerSecond = 100; // how finely a server may ask for more, which nobody needs
constexpr int timingsToJudge = 2;
constexpr std::int64_t longestSilence = 60; // seconds; more is no count but "unknown"
constexpr std::uint32_t whatever = static_cast<std::uint32_t>(-1);

constexpr char restoreKey[] = "module-stream-restore.id";
constexpr char restoreId[] = "sink-input-by-application-id:ostrel.tarnd";

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

// The server takes more than it asks for. So it is told to ask for no more than the device takes at a time:
// we write on our own clock, and are not woken up.
pa_buffer_attr bufferOf(const PcmFormat& format, std::chrono::milliseconds latency) {
    const auto request = format.rate / requestsPerSecond;
    const auto device = static_cast<std::size_t>(latency.count()) * format.rate / 1000;
    const auto bytes = [&](std::size_t frames) {
        return static_cast<std::uint32_t>(frames * format.bytesPerFrame());
    };
    return {whatever, bytes(device + 2 * request), 0, bytes(request), whatever};
}

// The steady clock is read first: an interruption in between makes the age too long, and the report too
// early, which a clock that takes the latest reports passes over.
std::chrono::nanoseconds steadyTimeOf(const timeval& wallTime) {
    const auto steady = std::chrono::steady_clock::now().time_since_epoch();
    timeval now{};
    gettimeofday(&now, nullptr);
    const auto age = std::chrono::seconds(now.tv_sec - wallTime.tv_sec) +
                     std::chrono::microseconds(now.tv_usec - wallTime.tv_usec);
    return steady - std::clamp<std::chrono::nanoseconds>(age, 0s, 1s); // the wall clock may be set
}

} // namespace

struct PulseStream::Callbacks {
    static PulseStream& self(void* data) { return *static_cast<PulseStream*>(data); }

    static void stateChanged(pa_stream* stream, void* data) {
        const pa_stream_state_t state = pa_stream_get_state(stream);
        if (state == PA_STREAM_READY) {
            self(data).ready_ = true;
            self(data).device_ = pa_stream_get_device_index(stream);
            self(data).listener_->streamReady();
        } else if (!PA_STREAM_IS_GOOD(state) &&
                   PA_CONTEXT_IS_GOOD(pa_context_get_state(pa_stream_get_context(stream)))) {
            self(data).listener_->streamKilled();
        }
    }

    static void event(pa_stream*, const char* name, pa_proplist*, void* data) {
        if (std::strcmp(name, PA_STREAM_EVENT_REQUEST_CORK) == 0)
            self(data).listener_->streamToBeInterrupted();
        else if (std::strcmp(name, PA_STREAM_EVENT_REQUEST_UNCORK) == 0)
            self(data).listener_->streamToBeReleased();
    }

    static void timing(pa_stream* stream, int success, void* data) {
        if (success == 0)
            return;
        if (const pa_timing_info* info = pa_stream_get_timing_info(stream))
            self(data).judgeTakingBack(*info);
        self(data).listener_->streamTimingUpdated();
    }
};

void PulseStream::StreamDelete::operator()(pa_stream* stream) const {
    pa_stream_set_state_callback(stream, nullptr, nullptr);
    pa_stream_set_event_callback(stream, nullptr, nullptr);
    pa_stream_disconnect(stream);
    pa_stream_unref(stream);
}

void PulseStream::OperationDelete::operator()(pa_operation* operation) const {
    pa_operation_cancel(operation);
    pa_operation_unref(operation);
}

PulseStream::PulseStream(pa_context* context, PulseServerKind server, std::shared_ptr<Streams> streams,
                         const PcmFormat& format, SoundStreamListener& listener)
    : server_(server),
      streams_(std::move(streams)),
      format_(format),
      listener_(&listener),
      takesBack_(server == PulseServerKind::pipeWire ? TakesBack::no : TakesBack::unknown) {
    streams_->insert(this);
    const Properties properties;
    properties.set(PA_PROP_MEDIA_ICON_NAME, "audio-x-generic");
    // The volume shall be that of this program, not that of everything that plays music. PulseAudio is told
    // so; PipeWire goes by the role if there is one, and by the program's id otherwise.
    if (server_ == PulseServerKind::pulseAudio) {
        properties.set(PA_PROP_MEDIA_ROLE, "music");
        properties.set(restoreKey, restoreId);
    }
    const pa_sample_spec spec = specOf(format);
    const pa_channel_map map = channelMapOf(format);
    stream_.reset(pa_stream_new_with_proplist(context, "Playback", &spec, &map, properties.list));
    pa_stream_set_state_callback(stream_.get(), Callbacks::stateChanged, this);
    pa_stream_set_event_callback(stream_.get(), Callbacks::event, this);
    const pa_buffer_attr buffer =
        bufferOf(format, takesBack_ == TakesBack::no ? shallowLatency : deepLatency);
    pa_stream_connect_playback(stream_.get(), nullptr, &buffer, PA_STREAM_START_CORKED, nullptr, nullptr);
}

PulseStream::~PulseStream() { streams_->erase(this); }

std::size_t PulseStream::capacity() const {
    return std::min(bufferSeconds * format_.rate, mostBytes / format_.bytesPerFrame());
}

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
    const pa_timing_info* info = pa_stream_get_timing_info(stream_.get());
    const auto from = frame * static_cast<std::int64_t>(format_.bytesPerFrame());
    if (takesBack_ == TakesBack::unknown && overwritten_ == 0 && info != nullptr && from < info->read_index) {
        overwritten_ = timingsToJudge;
        takenTwice_ = static_cast<std::int64_t>(info->since_underrun) - info->read_index;
    }
    write(data, frames, frame, PA_SEEK_ABSOLUTE);
}

void PulseStream::writeSoon(std::size_t margin, const std::byte* data, std::size_t frames) {
    write(data, frames, static_cast<std::int64_t>(margin), PA_SEEK_RELATIVE_ON_READ);
}

void PulseStream::askForLatency(std::chrono::milliseconds latency) {
    const pa_buffer_attr buffer = bufferOf(format_, latency);
    letGo(pa_stream_set_buffer_attr(stream_.get(), &buffer, nullptr, nullptr));
}

void PulseStream::updateTiming() {
    timingQuery_.reset(pa_stream_update_timing_info(stream_.get(), Callbacks::timing, this));
}

// What was overwritten after the device had taken it, and was taken anew, has been played twice as the server
// counts.
void PulseStream::judgeTakingBack(const pa_timing_info& info) {
    if (overwritten_ == 0 || info.playing == 0)
        return;
    if (static_cast<std::int64_t>(info.since_underrun) - info.read_index > takenTwice_) {
        takesBack_ = TakesBack::yes;
        overwritten_ = 0;
    } else if (--overwritten_ == 0) {
        takesBack_ = TakesBack::no;
        askForLatency(shallowLatency);
    }
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
    timing.time = steadyTimeOf(info->timestamp);
    const bool ranDry = info->playing == 0 && info->read_index > 0 && info->read_index >= info->write_index;
    timing.playing = info->playing != 0 || ranDry;
    if (ranDry && info->since_underrun < longestSilence * format_.rate * size)
        timing.silence = static_cast<std::int64_t>(info->since_underrun) / size;
    return timing;
}

// The server moves a stream when it is told to, and when it has to. A jack shows in the port of its card:
// when what was plugged in is gone, another port sounds.
void PulseStream::surveyed(const PulseFindings& findings) {
    if (!ready_)
        return;
    const auto before = findings.sinks.find(device_);
    const auto now = findings.sinkOfStream.find(pa_stream_get_index(stream_.get()));
    const bool known = std::exchange(deviceKnown_, true);
    const bool gone = before == findings.sinks.end();
    const bool unplugged = !gone && !port_.empty() && before->second.port != port_ &&
                           std::ranges::count(before->second.absentPorts, port_) > 0;
    const bool moved = now != findings.sinkOfStream.end() && now->second != device_;
    if (moved)
        device_ = now->second;
    const auto sink = findings.sinks.find(device_);
    port_ = sink == findings.sinks.end() ? std::string() : sink->second.port;
    if (moved && server_ == PulseServerKind::pulseAudio) {
        takesBack_ = TakesBack::unknown;
        overwritten_ = 0;
        askForLatency(deepLatency);
    }
    if (known && (gone || unplugged))
        listener_->streamDeviceVanished();
    else if (moved)
        listener_->streamMoved();
}

void PulseStream::setDescription(const std::string& title, const std::string& artist) {
    const Properties properties;
    properties.set(PA_PROP_MEDIA_NAME, title.empty() ? "Playback" : title);
    properties.set(PA_PROP_MEDIA_TITLE, title);
    properties.set(PA_PROP_MEDIA_ARTIST, artist);
    letGo(pa_stream_proplist_update(stream_.get(), PA_UPDATE_REPLACE, properties.list, nullptr, nullptr));
}

} // namespace tarn
