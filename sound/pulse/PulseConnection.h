#pragma once

#include <list>

#include "sound/SoundLibrary.h"

struct pa_context;
struct pa_mainloop_api;

namespace tarn {

/// A connection to PulseAudio's server, or to another that speaks its protocol.
class PulseConnection final : public SoundConnection {
public:
    /// Both outlive the connection.
    PulseConnection(pa_mainloop_api& events, SoundConnectionListener& listener);
    ~PulseConnection() override;

    void lookUpFormat(std::function<void(std::optional<PcmFormat>)> done) override;
    std::unique_ptr<SoundStream> makeStream(const PcmFormat& format, std::size_t bufferFrames,
                                            SoundStreamListener& listener) override;

private:
    struct ContextDelete {
        void operator()(pa_context* context) const;
    };
    struct FormatQuery;

    void stateChanged();

    SoundConnectionListener& listener_;
    std::list<FormatQuery> queries_; // not answered any more when the context is gone
    const std::unique_ptr<pa_context, ContextDelete> context_;
};

} // namespace tarn
