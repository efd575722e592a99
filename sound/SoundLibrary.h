#pragma once

#include <functional>
#include <memory>
#include <optional>

#include "player/Poller.h"
#include "sound/SoundStream.h"

namespace tarn {

/// What a sound server has and does, as far as it matters here.
struct SoundSurvey {
    bool device = false; ///< there is something to play on
    bool call = false;   ///< somebody's stream carries a phone call
};

/// Is told how a connection fares. Player thread, maybe inside a call of the library: what follows is to be
/// posted.
class SoundConnectionListener {
public:
    virtual ~SoundConnectionListener() = default;

    virtual void connectionReady() = 0;

    /// It did not come about, or has broken.
    virtual void connectionLost() = 0;

    /// While the server is watched: once when that begins, and after every change.
    virtual void serverSurveyed(const SoundSurvey& survey) = 0;
};

/// A connection to the sound server, or the attempt at one. Player thread.
class SoundConnection {
public:
    virtual ~SoundConnection() = default;

    /// Asks for the format of the device that is the default now, and calls `done` with it, or with none when
    /// there is nothing to play on. Is not called when the connection goes before.
    virtual void lookUpDevice(std::function<void(std::optional<PcmFormat>)> done) = 0;

    /// Follows what happens to the server's devices and streams, or ceases to. A stream notices only while
    /// the server is watched that its device is gone.
    virtual void watch(bool on) = 0;

    /// `listener` outlives the stream, the connection need not.
    virtual std::unique_ptr<SoundStream> makeStream(const PcmFormat& format,
                                                    SoundStreamListener& listener) = 0;
};

/// Speaks to the sound server, and sleeps while it waits for word from it.
///
/// Everything that knows the server's own library is behind this interface, so that it can be loaded when a
/// player first needs it. Player thread; outlives its connections and streams.
class SoundLibrary : public Poller {
public:
    /// Returns at once; `listener`, which outlives the connection, may be told before that. The server is not
    /// started when it is not there.
    virtual std::unique_ptr<SoundConnection> connect(SoundConnectionListener& listener) = 0;
};

/// What the module exports, under the name in soundModuleSymbol: makes a library, which the caller owns.
using SoundModuleFunction = SoundLibrary* (*)();
inline constexpr char soundModuleSymbol[] = "tarnSoundModule1";
inline constexpr char soundModuleFile[] = "libtarn-sound.so";

} // namespace tarn
