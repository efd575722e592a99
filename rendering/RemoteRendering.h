#pragma once

#include <optional>

#include "player/EventLoop.h"
#include "player/Rendering.h"

namespace tarn {

/// A rendering whose file may keep whoever reads it waiting: another one, which is opened, moved and rendered
/// a second ahead on a thread of its own. What is not at hand yet is waited for by nobody; the item fails
/// when a single call takes longer than the limit. The thread is left behind then, until the call returns.
class RemoteRendering final : public Rendering {
public:
    struct Options {
        std::chrono::nanoseconds limit{std::chrono::seconds(10)};
        std::optional<std::chrono::nanoseconds> length{}; ///< of the media, when it is known
    };

    /// `open` runs on the rendering's thread and owns what it needs. `goesOn` is called as the factory's
    /// contract says. `loop` outlives the rendering. None when there is no thread to be had.
    static std::unique_ptr<RemoteRendering> create(EventLoop& loop,
                                                   std::function<RenderingFactory::Outcome()> open,
                                                   std::function<void()> goesOn, Options options);

    ~RemoteRendering() override;

    Opening opening() const override;
    void seek(std::chrono::nanoseconds position, float rate, const PcmFormat& format) override;
    RenderedSpan render(PcmBuffer& buffer, std::size_t maxFrames) override;

private:
    class Worker;

    RemoteRendering(EventLoop& loop, std::shared_ptr<Worker> worker, std::function<void()> goesOn,
                    Options options);

    EventLoop& loop_;
    const std::function<void()> goesOn_;
    const Options options_;
    const std::shared_ptr<Worker> worker_;
    std::chrono::nanoseconds position_{0}; // where what was handed out last ends
    RegistrationHandle alarm_;             // for a call that takes too long
};

} // namespace tarn
