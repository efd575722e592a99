#include "bench/sound/Hearing.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <memory>
#include <stdexcept>

#include <pulse/simple.h>

namespace tarn {

Hearing::Hearing() : thread_([this] { run(); }) {
    std::unique_lock lock(mutex_);
    changed_.wait_for(lock, std::chrono::seconds(10), [this] { return heard_ != Heard::nothingYet; });
}

Hearing::~Hearing() {
    {
        const std::lock_guard lock(mutex_);
        ending_ = true;
    }
    thread_.join();
}

Hearing::Time Hearing::waitFor(bool sound) {
    const Heard wanted = sound ? Heard::sound : Heard::silence;
    std::unique_lock lock(mutex_);
    if (!changed_.wait_for(lock, std::chrono::seconds(20), [&] { return heard_ == wanted; }))
        throw std::runtime_error(sound ? "nothing is heard" : "it does not fall silent");
    return since_;
}

void Hearing::note(Heard heard) {
    const std::lock_guard lock(mutex_);
    if (heard == heard_)
        return;
    heard_ = heard;
    since_ = std::chrono::steady_clock::now();
    changed_.notify_all();
}

void Hearing::run() {
    std::array<std::int16_t, 882> piece{};
    constexpr auto asTheServerLikes = static_cast<std::uint32_t>(-1);
    const pa_sample_spec spec{PA_SAMPLE_S16NE, 44100, 2};
    const pa_buffer_attr buffer{asTheServerLikes, asTheServerLikes, asTheServerLikes, asTheServerLikes,
                                sizeof piece};
    const std::unique_ptr<pa_simple, decltype(&pa_simple_free)> stream(
        pa_simple_new(nullptr, "hearing", PA_STREAM_RECORD, "out.monitor", "hearing", &spec, nullptr, &buffer,
                      nullptr),
        pa_simple_free);
    const auto ends = [this] {
        const std::lock_guard lock(mutex_);
        return ending_;
    };
    while (stream && !ends() && pa_simple_read(stream.get(), piece.data(), sizeof piece, nullptr) >= 0) {
        const bool silent = std::ranges::all_of(piece, [](std::int16_t sample) { return sample == 0; });
        note(silent ? Heard::silence : Heard::sound);
    }
}

} // namespace tarn
