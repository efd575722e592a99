#include "sound/pulse/PulseConnection.h"

#include <pulse/pulseaudio.h>

#include "sound/pulse/PulseFormat.h"
#include "sound/pulse/PulseStream.h"

namespace tarn {

namespace {

// By which desktops and the sound server's memory of volumes know this program.
constexpr char applicationId[] = "ostrel.tarnd";

pa_context* makeContext(pa_mainloop_api& events) {
    pa_proplist* properties = pa_proplist_new();
    pa_proplist_sets(properties, PA_PROP_APPLICATION_NAME, "tarnd");
    pa_proplist_sets(properties, PA_PROP_APPLICATION_ID, applicationId);
    pa_proplist_sets(properties, PA_PROP_APPLICATION_ICON_NAME, "audio-x-generic");
    pa_context* context = pa_context_new_with_proplist(&events, "tarnd", properties);
    pa_proplist_free(properties);
    return context;
}

} // namespace

/// Answered for each device that is found, and once more at the end.
struct PulseConnection::FormatQuery {
    PulseConnection& connection;
    std::function<void(std::optional<PcmFormat>)> done;
    std::optional<PcmFormat> format;

    static void answered(pa_context*, const pa_sink_info* sink, int end, void* data) {
        auto& query = *static_cast<FormatQuery*>(data);
        if (sink != nullptr)
            query.format = formatOf(sink->sample_spec);
        if (end == 0)
            return;
        const auto* const place = &query;
        const FormatQuery answer = std::move(query);
        answer.connection.queries_.remove_if([place](const FormatQuery& other) { return &other == place; });
        answer.done(answer.format);
    }
};

void PulseConnection::ContextDelete::operator()(pa_context* context) const {
    pa_context_set_state_callback(context, nullptr, nullptr);
    pa_context_disconnect(context);
    pa_context_unref(context);
}

PulseConnection::PulseConnection(pa_mainloop_api& events, SoundConnectionListener& listener)
    : listener_(listener), context_(makeContext(events)) {
    pa_context_set_state_callback(
        context_.get(), [](pa_context*, void* self) { static_cast<PulseConnection*>(self)->stateChanged(); },
        this);
    // A failure is told through the state, at once or later.
    pa_context_connect(context_.get(), nullptr, PA_CONTEXT_NOAUTOSPAWN, nullptr);
}

PulseConnection::~PulseConnection() = default;

void PulseConnection::stateChanged() {
    const pa_context_state_t state = pa_context_get_state(context_.get());
    if (state == PA_CONTEXT_READY)
        listener_.connectionReady();
    else if (!PA_CONTEXT_IS_GOOD(state))
        listener_.connectionLost();
}

void PulseConnection::lookUpFormat(std::function<void(std::optional<PcmFormat>)> done) {
    FormatQuery& query = queries_.emplace_back(FormatQuery{*this, std::move(done), std::nullopt});
    pa_operation* operation =
        pa_context_get_sink_info_by_name(context_.get(), "@DEFAULT_SINK@", FormatQuery::answered, &query);
    if (operation == nullptr) // the connection is broken, which is told
        queries_.pop_back();
    else
        pa_operation_unref(operation);
}

std::unique_ptr<SoundStream> PulseConnection::makeStream(const PcmFormat& format, std::size_t bufferFrames,
                                                         SoundStreamListener& listener) {
    return std::make_unique<PulseStream>(context_.get(), format, bufferFrames, listener);
}

} // namespace tarn
