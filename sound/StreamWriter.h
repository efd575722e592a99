#pragma once

#include "pcm/Crossfade.h"
#include "pcm/FrameHistory.h"
#include "player/Output.h"
#include "sound/SoundStream.h"

namespace tarn {

/// Puts the frames of an output into a stream of the sound server, each at its place. Player thread.
///
/// An output counts its frames from its own beginning, a stream from when it was made: frame s of the stream
/// is frame base() + s of the output. The two stay in step, except when the stream has run out of frames and
/// the silence behind them is being heard. Then the next frame goes wherever the server reads just now, and
/// only the server can tell where that was: the place of the stream is not known until place() is called with
/// its answer.
class StreamWriter {
public:
    /// From now on frames go to `stream`, whose frame 0 is the output's frame `index`. The stream outlives
    /// this, or detach() is called first. The last `capacity` frames are remembered for crossfades.
    void attach(SoundStream& stream, std::int64_t index, std::size_t capacity);
    void detach() { stream_ = nullptr; }

    std::int64_t base() const { return base_; }
    bool placed() const { return !unplaced_; }

    /// Nothing has been written yet.
    bool empty() const { return filledTo_ == base_; }

    /// Writes `buffer` from `index` on, which is where the last write ended or was taken back to.
    void write(std::int64_t index, const PcmBuffer& buffer);

    /// The same when silence is heard already: the frames are heard as soon as can be, but for `margin`
    /// frames that they take to the server.
    void writeLate(std::int64_t index, const PcmBuffer& buffer, std::size_t margin);

    /// Nothing that was written from `index` to `end` is heard. What is written next follows as `join` says.
    void takeBack(std::int64_t index, std::int64_t end, Output::Join join);

    /// Writes the frames from `index` to `end`, which are remembered, once more. Nothing is heard of that; it
    /// shows whether the device gives back what has left for it.
    void writeAgain(std::int64_t index, std::int64_t end);

    /// The server's answer to the question where writeLate() has put its frames; the output will write at
    /// `index` next.
    void place(const SoundStream::Timing& timing, std::int64_t index);

private:
    void send(std::int64_t index, const PcmBuffer& buffer);

    SoundStream* stream_ = nullptr;
    PcmFormat format_;
    FrameHistory history_;
    Crossfade crossfade_;
    std::int64_t base_ = 0;
    std::int64_t filledTo_ = 0; // up to here the server has frames, ours or silence
    bool jumps_ = false;        // the next write begins elsewhere than where the last one ended
    bool unplaced_ = false;
};

} // namespace tarn
