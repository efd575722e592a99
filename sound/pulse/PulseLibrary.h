#pragma once

#include <memory>
#include <vector>

#include "sound/SoundLibrary.h"

struct pa_mainloop;

namespace tarn {

/// PulseAudio's client library with its main loop.
class PulseLibrary final : public SoundLibrary {
public:
    PulseLibrary();
    ~PulseLibrary() override;

    void watch(int descriptor, std::function<void()> readable) override;
    bool wait(bool idle) override;
    std::unique_ptr<SoundConnection> connect(SoundConnectionListener& listener) override;

private:
    struct MainLoopDelete {
        void operator()(pa_mainloop* loop) const;
    };

    std::vector<std::unique_ptr<std::function<void()>>> calls_; // at addresses that the main loop keeps
    const std::unique_ptr<pa_mainloop, MainLoopDelete> mainLoop_;
};

} // namespace tarn
