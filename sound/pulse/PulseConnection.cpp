#include "sound/pulse/PulseConnection.h"

#include <pulse/pulseaudio.h>

#include <string_view>
#include <utility>

#include "sound/pulse/PulseFormat.h"

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

/// Answered with the default device, if there is one, and once more at the end.
struct PulseConnection::Query {
    PulseConnection& connection;
    std::function<void(std::optional<PcmFormat>)> done;
    std::optional<PcmFormat> format;

    static void answered(pa_context*, const pa_sink_info* sink, int end, void* data) {
        auto& query = *static_cast<Query*>(data);
        if (sink != nullptr && !PulseSurvey::isDummy(sink->name))
            query.format = formatOf(sink->sample_spec);
        if (end == 0)
            return;
        const auto* const place = &query;
        const Query answer = std::move(query);
        answer.connection.queries_.remove_if([place](const Query& other) { return &other == place; });
        answer.done(answer.format);
    }
};

void PulseConnection::ContextDelete::operator()(pa_context* context) const {
    pa_context_set_state_callback(context, nullptr, nullptr);
    pa_context_disconnect(context);
    pa_context_unref(context);
}

PulseConnection::PulseConnection(pa_mainloop_api& events, SoundConnectionListener& listener)
    : listener_(listener),
      context_(makeContext(events)),
      survey_(context_.get(), [this](const PulseFindings& findings) { found(findings); }),
      streams_(std::make_shared<std::set<PulseStream*>>()) {
    pa_context_set_state_callback(
        context_.get(), [](pa_context*, void* self) { static_cast<PulseConnection*>(self)->stateChanged(); },
        this);
    // A failure is told through the state, at once or later.
    pa_context_connect(context_.get(), nullptr, PA_CONTEXT_NOAUTOSPAWN, nullptr);
}

PulseConnection::~PulseConnection() = default;

void PulseConnection::stateChanged() {
    const pa_context_state_t state = pa_context_get_state(context_.get());
    if (!PA_CONTEXT_IS_GOOD(state))
        return listener_.connectionLost();
    if (state != PA_CONTEXT_READY)
        return;
    pa_operation* operation = pa_context_get_server_info(
        context_.get(),
        [](pa_context*, const pa_server_info* info, void* data) {
            auto& self = *static_cast<PulseConnection*>(data);
            if (info == nullptr) // the connection breaks, which is told
                return;
            if (std::string_view(info->server_name).find("PipeWire") != std::string_view::npos)
                self.server_ = PulseServerKind::pipeWire;
            self.listener_.connectionReady();
        },
        this);
    if (operation != nullptr)
        pa_operation_unref(operation);
}

void PulseConnection::lookUpDevice(std::function<void(std::optional<PcmFormat>)> done) {
    Query& query = queries_.emplace_back(Query{*this, std::move(done), std::nullopt});
    pa_operation* operation =
        pa_context_get_sink_info_by_name(context_.get(), "@DEFAULT_SINK@", Query::answered, &query);
    if (operation == nullptr) // the connection is broken, which is told
        queries_.pop_back();
    else
        pa_operation_unref(operation);
}

void PulseConnection::watch(bool on) {
    watching_ = on;
    for (PulseStream* stream : *streams_)
        stream->forgetDevice();
    survey_.follow(on);
}

void PulseConnection::found(const PulseFindings& findings) {
    for (PulseStream* stream : std::set(*streams_))
        if (streams_->contains(stream))
            stream->surveyed(findings);
    if (watching_)
        listener_.serverSurveyed({.device = !findings.sinks.empty(), .call = findings.call});
}

std::unique_ptr<SoundStream> PulseConnection::makeStream(const PcmFormat& format,
                                                         SoundStreamListener& listener) {
    return std::make_unique<PulseStream>(context_.get(), server_, streams_, format, listener);
}

} // namespace tarn
