#pragma once

#include <list>
#include <optional>
#include <set>

#include "sound/SoundLibrary.h"
#include "sound/pulse/PulseStream.h"
#include "sound/pulse/PulseSurvey.h"

struct pa_context;
struct pa_mainloop_api;

namespace tarn {

/// A connection to PulseAudio's server, or to PipeWire's, which speaks its protocol.
class PulseConnection final : public SoundConnection {
public:
    /// Both outlive the connection.
    PulseConnection(pa_mainloop_api& events, SoundConnectionListener& listener);
    ~PulseConnection() override;

    void lookUpDevice(std::function<void(std::optional<PcmFormat>)> done) override;
    void watch(bool on) override;
    std::unique_ptr<SoundStream> makeStream(const PcmFormat& format, SoundStreamListener& listener) override;

private:
    struct ContextDelete {
        void operator()(pa_context* context) const;
    };
    struct Query;

    void stateChanged();
    void found(const PulseFindings& findings);

    SoundConnectionListener& listener_;
    std::list<Query> queries_; // not answered any more when the context is gone
    const std::unique_ptr<pa_context, ContextDelete> context_;
    PulseSurvey survey_;
    bool watching_ = false;
    PulseServerKind server_ = PulseServerKind::pulseAudio;
    const std::shared_ptr<std::set<PulseStream*>> streams_; // they may outlive the connection
};

} // namespace tarn
