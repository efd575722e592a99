#include "sound/SoundServer.h"

#include <algorithm>

#include "log/SystemLog.h"
#include "system/ModuleFile.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
constexpr auto firstDelay = 200ms;
constexpr auto longestDelay = 1500ms;

} // namespace

SoundServer::SoundServer(EventLoopThread& loop)
    : loop_(loop), delay_(firstDelay), self_(std::make_shared<SoundServer*>(this)) {}

SoundServer::~SoundServer() = default;

void SoundServer::remove(SoundServerListener& listener) {
    listeners_.erase(&listener);
    unwant(listener);
}

void SoundServer::want(SoundServerListener& listener) {
    wanting_.insert(&listener);
    if (!connection_) {
        delay_ = firstDelay;
        connect();
    }
}

SoundLibrary* SoundServer::library() {
    if (std::exchange(librarySought_, true))
        return library_.get();
    const auto [function, error] = loadFromModule(soundModuleFile, soundModuleSymbol);
    if (function == nullptr) {
        SystemLog::error("SoundServer::library", __LINE__,
                         "%{public}s:%d: Could not load %{public}s: %{public}s", soundModuleFile,
                         error.c_str());
        return nullptr;
    }
    library_.reset(reinterpret_cast<SoundModuleFunction>(function)());
    loop_.sleepIn(*library_);
    return library_.get();
}

void SoundServer::connect() {
    retry_.reset();
    ++attempt_;
    if (SoundLibrary* sound = library())
        connection_ = sound->connect(*this);
    else
        connectionLost();
}

// The library is in the middle of something: what follows is done from the loop.
void SoundServer::later(void (SoundServer::*what)()) {
    loop_.post([weak = std::weak_ptr(self_), what, attempt = attempt_] {
        if (const auto server = weak.lock(); server && (*server)->attempt_ == attempt)
            ((*server)->*what)();
    });
}

void SoundServer::found() {
    delay_ = firstDelay;
    ready_ = true;
    refreshFormat([this] {
        if (std::exchange(missed_, false))
            SystemLog::message("-[SoundServer found]", __LINE__, "%{public}s:%d: The sound server is back.");
        tell(&SoundServerListener::soundServerReady);
    });
}

void SoundServer::lost() {
    ready_ = false;
    ++attempt_; // nothing more is to be heard of this one
    connection_.reset();
    if (!std::exchange(missed_, true))
        SystemLog::error("-[SoundServer lost]", __LINE__,
                         "%{public}s:%d: No sound server: playing in silence until it is there.");
    if (library_ && !wanting_.empty())
        retryLater();
    tell(&SoundServerListener::soundServerLost);
}

void SoundServer::retryLater() {
    retry_ = loop_.at(loop_.now() + delay_, [this] {
        if (!wanting_.empty() && !connection_)
            connect();
    });
    delay_ = std::min<std::chrono::milliseconds>(2 * delay_, longestDelay);
}

// A listener may leave, and take others along, while it is told.
void SoundServer::tell(void (SoundServerListener::*what)()) {
    for (SoundServerListener* listener : std::set(listeners_))
        if (listeners_.contains(listener))
            (listener->*what)();
}

void SoundServer::refreshFormat(std::function<void()> done) {
    connection_->lookUpFormat([this, done = std::move(done)](std::optional<PcmFormat> format) {
        format_ = format.value_or(format_);
        done();
    });
}

} // namespace tarn
