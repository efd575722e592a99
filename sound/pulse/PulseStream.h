#pragma once

#include <memory>

#include "sound/SoundStream.h"

struct pa_context;
struct pa_operation;
struct pa_stream;

namespace tarn {

/// A stream of PulseAudio's server.
class PulseStream final : public SoundStream {
public:
    /// A stream with a buffer of `bufferFrames`. `listener` outlives it.
    PulseStream(pa_context* context, const PcmFormat& format, std::size_t bufferFrames,
                SoundStreamListener& listener);
    ~PulseStream() override;

    bool ready() const override { return ready_; }
    const PcmFormat& format() const override { return format_; }
    void cork(bool stopped) override;
    void write(const std::byte* data, std::size_t frames) override;
    void writeAt(std::int64_t frame, const std::byte* data, std::size_t frames) override;
    void writeSoon(std::size_t margin, const std::byte* data, std::size_t frames) override;
    void updateTiming() override;
    std::optional<Timing> timing() const override;
    void setDescription(const std::string& title, const std::string& artist) override;

private:
    struct Callbacks;
    struct CallSurvey;
    struct StreamDelete {
        void operator()(pa_stream* stream) const;
    };
    struct OperationDelete {
        void operator()(pa_operation* operation) const;
    };

    void write(const std::byte* data, std::size_t frames, std::int64_t offset, int seek);
    void checkOldDevice();
    void askForCalls();

    const PcmFormat format_;
    SoundStreamListener& listener_;
    std::unique_ptr<pa_stream, StreamDelete> stream_;
    std::unique_ptr<pa_operation, OperationDelete>
        timingQuery_; // not answered any more when the stream is gone
    bool ready_ = false;
    std::uint32_t device_ = 0;
    std::shared_ptr<PulseStream*> self_; // for answers that come when the stream is gone
};

} // namespace tarn
