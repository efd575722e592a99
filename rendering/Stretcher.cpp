#include "rendering/Stretcher.h"

#include <sonic.h>

#include <algorithm>
#include <cassert>
#include <cmath>
#include <cstdint>
#include <cstring>

namespace tarn {

namespace {

constexpr double steering = 0.01;   // by how much a stage is sped up or slowed down to get back in time
constexpr double tolerance = 0.003; // how far in seconds of output it may be out of time before that
constexpr double learning = 2;      // seconds of output in which a stage shows how much it keeps inside
constexpr double smoothing = 0.05;

struct SonicDelete {
    void operator()(sonicStream stream) const { sonicDestroyStream(stream); }
};

template <class Sample>
Sample* samplesOf(PcmBuffer& buffer) {
    return reinterpret_cast<Sample*>(buffer.bytes.data());
}

template <class Sample>
const Sample* samplesOf(const PcmBuffer& buffer) {
    return reinterpret_cast<const Sample*>(buffer.bytes.data());
}

} // namespace

/// One stream of the library. Formats but s16 pass through it as floats.
class Stretcher::Stage {
public:
    Stage(const PcmFormat& format, double speed)
        : format_(format),
          speed_(speed),
          stream_(sonicCreateStream(static_cast<int>(format.rate), static_cast<int>(format.channels))) {
        sonicSetSpeed(stream_.get(), static_cast<float>(speed));
    }

    void write(const PcmBuffer& in) {
        if (in.frames == 0)
            return;
        const int frames = static_cast<int>(in.frames);
        if (format_.sample == SampleFormat::s16) {
            shorts_.assign(samplesOf<short>(in), samplesOf<short>(in) + in.frames * format_.channels);
            sonicWriteShortToStream(stream_.get(), shorts_.data(), frames);
        } else {
            toFloats(in);
            sonicWriteFloatToStream(stream_.get(), floats_.data(), frames);
        }
        fed_ += static_cast<double>(in.frames);
    }

    void read(PcmBuffer& out) {
        const int frames = sonicSamplesAvailable(stream_.get());
        if (frames > 0)
            append(frames, out);
        steer();
    }

    void flush() { sonicFlushStream(stream_.get()); }

private:
    double scale() const {
        switch (format_.sample) {
        case SampleFormat::s24In32:
            return 8388608.0;
        case SampleFormat::s32:
            return 2147483648.0;
        default:
            return 1.0;
        }
    }

    void toFloats(const PcmBuffer& in) {
        const std::size_t count = in.frames * format_.channels;
        floats_.resize(count);
        const double factor = 1.0 / scale();
        for (std::size_t i = 0; i < count; ++i)
            floats_[i] = format_.sample == SampleFormat::f32
                             ? samplesOf<float>(in)[i]
                             : static_cast<float>(samplesOf<std::int32_t>(in)[i] * factor);
    }

    void append(int frames, PcmBuffer& out) {
        const std::size_t size = out.bytes.size();
        const auto count = static_cast<std::size_t>(frames) * format_.channels;
        out.bytes.resize(size + static_cast<std::size_t>(frames) * format_.bytesPerFrame());
        std::byte* into = out.bytes.data() + size;
        if (format_.sample == SampleFormat::s16) {
            sonicReadShortFromStream(stream_.get(), reinterpret_cast<short*>(into), frames);
        } else {
            floats_.resize(count);
            sonicReadFloatFromStream(stream_.get(), floats_.data(), frames);
            fromFloats(into, count);
        }
        out.frames += static_cast<std::size_t>(frames);
        made_ += frames;
    }

    void fromFloats(std::byte* into, std::size_t count) const {
        if (format_.sample == SampleFormat::f32) {
            std::memcpy(into, floats_.data(), count * sizeof(float));
            return;
        }
        const double most = scale() - 1;
        auto* samples = reinterpret_cast<std::int32_t*>(into);
        for (std::size_t i = 0; i < count; ++i)
            samples[i] = static_cast<std::int32_t>(std::lround(std::fmin(floats_[i] * scale(), most)));
    }

    // The library keeps some input inside, more or less from one piece to the next, but rounds to whole
    // periods: over minutes that adds up.
    void steer() {
        const double late = fed_ / speed_ - made_; // in frames of output
        if (made_ < learning * format_.rate) {
            usual_ += (late - usual_) / ++pieces_;
            smooth_ = usual_;
            return;
        }
        smooth_ += (late - smooth_) * smoothing;
        const double limit = tolerance * format_.rate;
        const double off = smooth_ - usual_;
        const double factor = off > limit ? 1 - steering : off < -limit ? 1 + steering : 1;
        if (factor != factor_)
            sonicSetSpeed(stream_.get(), static_cast<float>(speed_ * factor));
        factor_ = factor;
    }

    const PcmFormat format_;
    const double speed_;
    std::unique_ptr<std::remove_pointer_t<sonicStream>, SonicDelete> stream_;
    double fed_ = 0;
    double made_ = 0;
    double factor_ = 1;
    int pieces_ = 0;
    double usual_ = 0;
    double smooth_ = 0;
    std::vector<float> floats_;
    std::vector<short> shorts_;
};

Stretcher::Stretcher(const PcmFormat& format, double speed) : format_(format) {
    assert(speed >= slowest && speed <= fastest);
    const int stages = std::max(1, static_cast<int>(std::ceil(std::fabs(std::log2(speed)) - 1e-9)));
    const double each = std::pow(speed, 1.0 / stages);
    for (int i = 0; i < stages; ++i)
        stages_.push_back(std::make_unique<Stage>(format, each));
    between_.resize(stages_.size());
}

Stretcher::~Stretcher() = default;

void Stretcher::stretch(const PcmBuffer& in, PcmBuffer& out) { run(&in, out); }

void Stretcher::drain(PcmBuffer& out) { run(nullptr, out); }

void Stretcher::run(const PcmBuffer* in, PcmBuffer& out) {
    for (std::size_t i = 0; i < stages_.size(); ++i) {
        if (i > 0)
            stages_[i]->write(between_[i]);
        else if (in != nullptr)
            stages_[i]->write(*in);
        if (in == nullptr)
            stages_[i]->flush();
        PcmBuffer& next = i + 1 < stages_.size() ? between_[i + 1] : out;
        if (&next != &out)
            next.clear();
        stages_[i]->read(next);
    }
}

} // namespace tarn
