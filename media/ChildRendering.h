#pragma once

#include <cstdint>
#include <optional>

#include "media/MediaProcess.h"
#include "mediaprotocol/RingReader.h"
#include "player/EventLoopThread.h"
#include "player/Rendering.h"

namespace tarn {

/// A rendering whose frames a process of its own makes, two seconds ahead, and lays into a ring.
///
/// Nobody waits for that process. What is not in the ring yet is asked for, and word of it comes on the
/// socket; when that takes ten seconds, or the process ends, or says what cannot be, the item fails and
/// nothing else does. In the steady state one message a second goes out, that there is room again, and none
/// comes back.
class ChildRendering final : public Rendering {
public:
    /// `child` has been asked to open the file. `length` is that of the media, when it is known. `goesOn` as
    /// the factory's contract says. `loop` and `process` outlive the rendering.
    ChildRendering(EventLoopThread& loop, MediaProcess& process, MediaChild child, RingReader ring,
                   std::optional<std::chrono::nanoseconds> length, std::function<void()> goesOn);

    Opening opening() const override;
    void seek(std::chrono::nanoseconds position, float rate, const PcmFormat& format) override;
    RenderedSpan render(PcmBuffer& buffer, std::size_t maxFrames) override;

private:
    RingReader::Taken takeFromRing(PcmBuffer& buffer, std::size_t maxFrames);
    RenderedSpan spanOf(const MediaSpan& span);
    RenderedSpan emptySpan(RenderedSpan::State state) const;
    void beginWait();
    void endWait();
    void wordIsThere();
    void childIsLate();
    bool readMessages();
    bool isTrue(const ReceivedMessage& message);
    void fail(Error error);

    EventLoopThread& loop_;
    MediaProcess& process_;
    std::optional<MediaChild> child_; // none when it has failed
    RingReader ring_;
    const std::optional<std::chrono::nanoseconds> length_;
    const std::function<void()> goesOn_;

    bool opened_ = false;
    bool gone_ = false;           // the child, though what it made is still in the ring
    std::optional<Error> error_;  // nothing follows any more
    std::optional<Error> reason_; // of the span with which this generation fails
    std::uint64_t wordsWanted_ = 0;
    std::uint64_t wordsGiven_ = 0;

    // Since the last seek.
    std::uint32_t generation_ = 0;
    PcmFormat format_;
    bool backwards_ = false;
    std::chrono::nanoseconds position_{0}; // where what was handed out ends
    bool ended_ = false;
    bool waited_ = false;

    // While word of the child is waited for.
    RegistrationHandle watch_;
    RegistrationHandle alarm_;
};

} // namespace tarn
