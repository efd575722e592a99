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
/// nothing else does. When the parent of that process has ended, and it with it, the file is not to blame:
/// another process goes on where this one was, and the listener hears at most a short gap. In the steady
/// state one message a second goes out, that there is room again, and none comes back.
class ChildRendering final : public Rendering {
public:
    /// A process that has been asked to open the file, and its ring.
    struct Renderer {
        MediaChild child;
        RingReader ring;
    };

    /// `length` is that of the media, when it is known. `goesOn` as the factory's contract says. `another`
    /// makes one more renderer of the same file, if it can. `loop` and `process` outlive the rendering.
    ChildRendering(EventLoopThread& loop, MediaProcess& process, Renderer renderer,
                   std::optional<std::chrono::nanoseconds> length, std::function<void()> goesOn,
                   std::function<std::optional<Renderer>()> another);

    Opening opening() const override;
    void seek(std::chrono::nanoseconds position, float rate, const PcmFormat& format) override;
    RenderedSpan render(PcmBuffer& buffer, std::size_t maxFrames) override;

private:
    RingReader::Taken takeFromRing(PcmBuffer& buffer, std::size_t maxFrames);
    RenderedSpan spanOf(const MediaSpan& span);
    RenderedSpan emptySpan(RenderedSpan::State state) const;
    void askToSeek();
    bool settleLoss();
    bool beginAnew();
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
    const std::function<std::optional<Renderer>()> another_;

    bool opened_ = false;         // by the child that there is
    bool wasOpened_ = false;      // by it or one before
    bool anew_ = false;           // was begun, and nothing has come since
    bool lossWasSeen_ = false;    // and was not the parent's then
    bool gone_ = false;           // the child, though what it made is still in the ring
    std::optional<Error> error_;  // nothing follows any more
    std::optional<Error> reason_; // of the span with which this generation fails
    std::uint64_t wordsWanted_ = 0;
    std::uint64_t wordsGiven_ = 0;

    // Since the last seek.
    std::uint32_t generation_ = 0;
    PcmFormat format_;
    float rate_ = 1;
    std::chrono::nanoseconds position_{0}; // where what was handed out ends
    bool ended_ = false;
    bool waited_ = false;

    // While word of the child is waited for.
    RegistrationHandle watch_;
    RegistrationHandle alarm_;
    RegistrationHandle lossAlarm_; // while it is not known yet whether the parent has ended too
};

} // namespace tarn
