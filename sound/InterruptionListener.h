#pragma once

namespace tarn {

/// Is told when streams are to be silent for something more important, a call for example. Called on the
/// player thread. `stream` only identifies it.
class InterruptionListener {
public:
    virtual ~InterruptionListener() = default;

    /// `stream`, which was playing, is to be silent. Comes again when it is started nevertheless.
    virtual void streamInterrupted(const void* stream) = 0;

    /// It may sound again.
    virtual void streamReleased(const void* stream) = 0;

    /// It is gone: nothing will be said about it any more.
    virtual void streamGone(const void* stream) = 0;
};

} // namespace tarn
