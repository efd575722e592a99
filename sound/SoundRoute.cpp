#include "sound/SoundRoute.h"

#include <utility>

#include "sound/SoundError.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr auto serverPatience = 500ms;
constexpr auto streamRetry = 1500ms;

} // namespace

SoundRoute::SoundRoute(EventLoop& loop, SoundServer& server, InterruptionListener& interruptions,
                       SoundRouteListener& listener)
    : loop_(loop),
      server_(server),
      interruptions_(interruptions),
      listener_(listener),
      self_(std::make_shared<SoundRoute*>(this)) {
    server_.add(*this);
}

SoundRoute::~SoundRoute() {
    server_.remove(*this);
    interruptions_.streamGone(this);
}

void SoundRoute::later(std::function<void(SoundRoute&)> work) {
    loop_.post([weak = std::weak_ptr(self_), work = std::move(work)] {
        if (const auto self = weak.lock())
            work(**self);
    });
}

void SoundRoute::start() {
    started_ = true;
    server_.want(*this);
    if (mode_ == Mode::idle)
        seek();
    if (askedForSilence_ || server_.call())
        later([](SoundRoute& self) { self.silenceOrRelease(true); });
}

void SoundRoute::stop() {
    started_ = false;
    if (!silenced_) // otherwise the end of that is waited for
        server_.unwant(*this);
}

void SoundRoute::playOut() {
    if (mode_ == Mode::sounding)
        server_.playOut(std::move(stream_));
}

std::optional<Error> SoundRoute::silentBecause() const {
    if (mode_ != Mode::silent || server_.silenceIsChosen())
        return std::nullopt;
    return server_.missing();
}

// -- Getting a stream.

void SoundRoute::seek() {
    if (server_.silenceIsChosen()) {
        mode_ = Mode::silent;
        return;
    }
    mode_ = Mode::waiting;
    patience_ = loop_.at(loop_.now() + serverPatience, [this] {
        if (mode_ == Mode::waiting)
            setMode(Mode::silent);
    });
    if (server_.ready())
        openStream();
}

void SoundRoute::soundServerReady() {
    if (!stream_ && mode_ != Mode::idle)
        openStream();
}

void SoundRoute::openStream() {
    server_.refreshDevice([weak = std::weak_ptr(self_)] {
        if (const auto self = weak.lock())
            (*self)->makeStream();
    });
}

void SoundRoute::makeStream() {
    if (stream_ || mode_ == Mode::idle || !server_.ready())
        return;
    stream_ = server_.makeStream(static_cast<SoundStreamListener&>(*this));
}

void SoundRoute::streamReady() {
    later([](SoundRoute& self) { self.adoptStream(); });
}

void SoundRoute::adoptStream() {
    if (!stream_ || !stream_->ready())
        return;
    patience_.reset();
    stream_->setDescription(title_, artist_);
    setMode(Mode::sounding);
}

void SoundRoute::setMode(Mode mode) {
    mode_ = mode;
    listener_.routeChanged();
}

// -- Losing it.

void SoundRoute::loseStream() {
    stream_.reset();
    askedForSilence_ = false;
    silenced_ = false;
    interruptions_.streamGone(this);
    if (!started_)
        server_.unwant(*this);
}

void SoundRoute::soundServerLost() {
    loseStream();
    if (mode_ == Mode::waiting || (mode_ == Mode::sounding && started_))
        setMode(Mode::silent);
    else if (mode_ == Mode::sounding)
        setMode(Mode::idle);
}

void SoundRoute::streamKilled() {
    later([](SoundRoute& self) {
        self.loseStream();
        if (self.mode_ == Mode::sounding) {
            self.setMode(Mode::idle);
            self.listener_.routeDeviceVanished();
            return;
        }
        if (self.mode_ == Mode::waiting) // the device has gone just now
            self.setMode(Mode::silent);
        self.patience_ = self.loop_.at(self.loop_.now() + streamRetry, [route = &self] {
            if (!route->stream_ && route->started_ && route->server_.ready())
                route->openStream();
        });
    });
}

void SoundRoute::streamDeviceVanished() {
    later([](SoundRoute& self) { self.listener_.routeDeviceVanished(); });
}

void SoundRoute::streamMoved() {
    if (mode_ == Mode::sounding)
        listener_.routeMoved();
}

void SoundRoute::streamTimingUpdated() {
    if (mode_ == Mode::sounding)
        listener_.routeTimingUpdated();
}

void SoundRoute::setDescription(const std::string& title, const std::string& artist) {
    title_ = title;
    artist_ = artist;
    if (mode_ == Mode::sounding)
        stream_->setDescription(title, artist);
}

// -- Silence for something more important.

// A stream that stands still is asked as well, and is kept mute until it is released.
void SoundRoute::streamToBeInterrupted() {
    askedForSilence_ = true;
    later([](SoundRoute& self) { self.silenceOrRelease(false); });
}

void SoundRoute::streamToBeReleased() {
    askedForSilence_ = false;
    later([](SoundRoute& self) { self.silenceOrRelease(false); });
}

// The server's own request and a call that is seen may be the same thing: they make one interruption.
void SoundRoute::silenceOrRelease(bool starting) {
    const bool silence = askedForSilence_ || server_.call();
    if (silence && started_ && (starting || !silenced_)) {
        silenced_ = true;
        interruptions_.streamInterrupted(this);
    } else if (!silence && silenced_) {
        silenced_ = false;
        interruptions_.streamReleased(this);
        if (!started_)
            server_.unwant(*this);
    }
}

} // namespace tarn
