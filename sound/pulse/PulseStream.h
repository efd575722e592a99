#pragma once

#include <memory>
#include <optional>
#include <set>
#include <string>

#include "sound/SoundStream.h"

struct pa_context;
struct pa_operation;
struct pa_stream;
struct pa_timing_info;

namespace tarn {

struct PulseFindings;

/// Both speak the same protocol, and differ in what they do with it.
enum class PulseServerKind : std::uint8_t { pulseAudio, pipeWire };

/// A stream of PulseAudio's or PipeWire's server.
///
/// The server keeps two seconds of it, and has the device take from them what is heard next. How much that is
/// we may ask for. A device that gives frames back should take half a second at a time, since each time wakes
/// several programs up; one that does not, as little as is heard before an edit is missed. Most devices of
/// PulseAudio give back, and none of PipeWire does. So PulseAudio is asked for much, until a device shows
/// that it cannot give back: whatever a server has taken twice it tells as played, but not as read.
class PulseStream final : public SoundStream {
public:
    using Streams = std::set<PulseStream*>;

    /// Stands among `streams` while it lives. `listener` outlives it.
    PulseStream(pa_context* context, PulseServerKind server, std::shared_ptr<Streams> streams,
                const PcmFormat& format, SoundStreamListener& listener);
    ~PulseStream() override;

    void setListener(SoundStreamListener& listener) override { listener_ = &listener; }
    bool ready() const override { return ready_; }
    const PcmFormat& format() const override { return format_; }
    std::size_t capacity() const override;
    void cork(bool stopped) override;
    void write(const std::byte* data, std::size_t frames) override;
    void writeAt(std::int64_t frame, const std::byte* data, std::size_t frames) override;
    void writeSoon(std::size_t margin, const std::byte* data, std::size_t frames) override;
    TakesBack takesBack() const override { return takesBack_; }
    void updateTiming() override;
    std::optional<Timing> timing() const override;
    void setDescription(const std::string& title, const std::string& artist) override;

    /// The server has not been watched up to now: the device may be another one.
    void forgetDevice() { deviceKnown_ = false; }

    /// What was found out about the server's devices.
    void surveyed(const PulseFindings& findings);

private:
    struct Callbacks;
    struct StreamDelete {
        void operator()(pa_stream* stream) const;
    };
    struct OperationDelete {
        void operator()(pa_operation* operation) const;
    };

    void write(const std::byte* data, std::size_t frames, std::int64_t offset, int seek);
    void askForLatency(std::chrono::milliseconds latency);
    void judgeTakingBack(const pa_timing_info& info);

    const PulseServerKind server_;
    const std::shared_ptr<Streams> streams_;
    const PcmFormat format_;
    SoundStreamListener* listener_;
    std::unique_ptr<pa_stream, StreamDelete> stream_;
    std::unique_ptr<pa_operation, OperationDelete>
        timingQuery_; // not answered any more when the stream is gone
    bool ready_ = false;
    std::uint32_t device_ = 0;
    bool deviceKnown_ = false; // it cannot have been another one unseen
    std::string port_;

    TakesBack takesBack_;
    std::int64_t takenTwice_ = 0; // bytes that were played, as the server counts, and are not read
    int overwritten_ = 0;         // timings that are still to be seen before it counts as not given back
};

} // namespace tarn
