#include "sound/pulse/PulseSurvey.h"

#include <pulse/pulseaudio.h>

#include <string_view>
#include <utility>

#include "sound/pulse/PulseFormat.h"

namespace tarn {

namespace {

bool isPhone(const pa_proplist* properties) {
    const char* role = pa_proplist_gets(properties, PA_PROP_MEDIA_ROLE);
    return role != nullptr && role == std::string_view("phone");
}

} // namespace

struct PulseSurvey::Callbacks {
    static PulseSurvey& self(void* data) { return *static_cast<PulseSurvey*>(data); }

    static void changed(pa_context*, pa_subscription_event_type_t, std::uint32_t, void* data) {
        self(data).look();
    }

    static void sink(pa_context*, const pa_sink_info* info, int end, void* data) {
        if (end != 0)
            return self(data).answered();
        if (isDummy(info->name))
            return;
        PulseFindings::Sink& sink = self(data).findings_.sinks[info->index];
        sink.name = info->name;
        sink.format = formatOf(info->sample_spec);
        if (info->active_port != nullptr)
            sink.port = info->active_port->name;
        for (std::uint32_t i = 0; i < info->n_ports; ++i)
            if (info->ports[i]->available == PA_PORT_AVAILABLE_NO)
                sink.absentPorts.emplace_back(info->ports[i]->name);
    }

    static void playing(pa_context*, const pa_sink_input_info* info, int end, void* data) {
        if (end != 0)
            return self(data).answered();
        self(data).findings_.sinkOfStream[info->index] = info->sink;
        self(data).findings_.call |= info->corked == 0 && isPhone(info->proplist);
    }

    static void recording(pa_context*, const pa_source_output_info* info, int end, void* data) {
        if (end != 0)
            return self(data).answered();
        self(data).findings_.call |= info->corked == 0 && isPhone(info->proplist);
    }
};

void PulseSurvey::OperationDelete::operator()(pa_operation* operation) const {
    pa_operation_cancel(operation);
    pa_operation_unref(operation);
}

PulseSurvey::PulseSurvey(pa_context* context, std::function<void(const PulseFindings&)> found)
    : context_(context), found_(std::move(found)) {
    pa_context_set_subscribe_callback(context_, Callbacks::changed, this);
}

PulseSurvey::~PulseSurvey() { pa_context_set_subscribe_callback(context_, nullptr, nullptr); }

bool PulseSurvey::isDummy(const char* sinkName) { return sinkName == std::string_view("auto_null"); }

void PulseSurvey::follow(bool on) {
    const int events = PA_SUBSCRIPTION_MASK_SINK | PA_SUBSCRIPTION_MASK_SINK_INPUT |
                       PA_SUBSCRIPTION_MASK_SOURCE_OUTPUT | PA_SUBSCRIPTION_MASK_SERVER;
    const auto mask = static_cast<pa_subscription_mask_t>(on ? events : PA_SUBSCRIPTION_MASK_NULL);
    if (pa_operation* operation = pa_context_subscribe(context_, mask, nullptr, nullptr))
        pa_operation_unref(operation);
    if (on)
        look();
}

void PulseSurvey::look() {
    if (unanswered_ > 0)
        again_ = true;
    else
        ask();
}

void PulseSurvey::ask() {
    again_ = false;
    findings_ = {};
    questions_.clear();
    for (pa_operation* question :
         {pa_context_get_sink_info_list(context_, Callbacks::sink, this),
          pa_context_get_sink_input_info_list(context_, Callbacks::playing, this),
          pa_context_get_source_output_info_list(context_, Callbacks::recording, this)})
        if (question != nullptr) // otherwise the connection is broken, which is told
            questions_.emplace_back(question);
    unanswered_ = questions_.size();
}

void PulseSurvey::answered() {
    if (--unanswered_ > 0)
        return;
    if (again_)
        return ask();
    found_(findings_);
}

} // namespace tarn
