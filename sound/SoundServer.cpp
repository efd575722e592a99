#include "sound/SoundServer.h"

#include <algorithm>
#include <cstdlib>
#include <string_view>
#include <utility>

#include "log/SystemLog.h"
#include "sound/SoundError.h"
#include "system/ModuleFile.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
constexpr auto firstDelay = 200ms;
constexpr auto longestDelay = 1500ms;

bool chosenSilent() {
    const char* choice = std::getenv("TARND_SOUND");
    return choice != nullptr && choice == std::string_view("none");
}

/// Of streams that nobody needs any more.
class NoListener final : public SoundStreamListener {
    void streamReady() override {}
    void streamKilled() override {}
    void streamDeviceVanished() override {}
    void streamMoved() override {}
    void streamTimingUpdated() override {}
    void streamToBeInterrupted() override {}
    void streamToBeReleased() override {}
} noListener;

} // namespace

/// Somebody who waits for something to sound on.
struct SoundServer::Request {
    std::function<void(std::optional<Error>)> done;
    RegistrationHandle limit;
};

/// A stream that plays what it still holds.
struct SoundServer::Ending {
    std::unique_ptr<SoundStream> stream;
    RegistrationHandle timer;
};

SoundServer::SoundServer(EventLoopThread& loop)
    : loop_(loop), silent_(chosenSilent()), delay_(firstDelay), self_(std::make_shared<SoundServer*>(this)) {}

SoundServer::~SoundServer() = default;

void SoundServer::prepare() {
    if (!silent_)
        library();
}

void SoundServer::remove(SoundServerListener& listener) {
    listeners_.erase(&listener);
    unwant(listener);
}

void SoundServer::want(SoundServerListener& listener) {
    wanting_.insert(&listener);
    seek();
}

void SoundServer::unwant(SoundServerListener& listener) {
    wanting_.erase(&listener);
    watchIfWanted();
}

void SoundServer::request(std::chrono::nanoseconds limit, std::function<void(std::optional<Error>)> done) {
    if (silent_ || !wanting_.empty())
        return done(std::nullopt);
    const auto request = requests_.insert(requests_.end(), {std::move(done), nullptr});
    request->limit = loop_.at(loop_.now() + limit, [this, request] {
        const auto answer = std::move(request->done);
        requests_.erase(request);
        watchIfWanted();
        answer(missing());
    });
    seek();
    if (connected_) // it was found before: what is there now?
        refreshDevice([this] {
            if (ready())
                answerRequests(std::nullopt);
        });
}

void SoundServer::answerRequests(const std::optional<Error>& error) {
    const auto requests = std::exchange(requests_, {});
    for (const Request& request : requests)
        request.done(error);
    watchIfWanted();
}

Error SoundServer::missing() const {
    return soundError(connected_ ? SoundErrorCode::noDevice : SoundErrorCode::noServer);
}

void SoundServer::seek() {
    if (connected_) {
        watchIfWanted();
    } else if (!connection_ && !silent_) {
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
void SoundServer::later(std::function<void(SoundServer&)> work) {
    loop_.post([weak = std::weak_ptr(self_), work = std::move(work), attempt = attempt_] {
        if (const auto server = weak.lock(); server && (*server)->attempt_ == attempt)
            work(**server);
    });
}

void SoundServer::connectionReady() {
    later([](SoundServer& self) { self.found(); });
}

void SoundServer::connectionLost() {
    later([](SoundServer& self) { self.lost(); });
}

void SoundServer::found() {
    delay_ = firstDelay;
    connected_ = true;
    watchIfWanted();
    lookForDevice();
}

void SoundServer::lookForDevice() {
    refreshDevice([this] {
        if (ready())
            deviceFound();
    });
}

void SoundServer::deviceFound() {
    if (std::exchange(missed_, false))
        SystemLog::message("-[SoundServer deviceFound]", __LINE__,
                           "%{public}s:%d: The sound server is back.");
    answerRequests(std::nullopt);
    tell(&SoundServerListener::soundServerReady);
}

void SoundServer::lost() {
    connected_ = false;
    device_.reset();
    watching_ = false;
    ++attempt_; // nothing more is to be heard of this one
    connection_.reset();
    if (!std::exchange(missed_, true))
        SystemLog::error("-[SoundServer lost]", __LINE__,
                         "%{public}s:%d: No sound server: what plays goes on in silence until it is there.");
    setCall(false);
    if (!library_)
        answerRequests(missing());
    else if (wanted())
        retryLater();
    tell(&SoundServerListener::soundServerLost);
}

void SoundServer::retryLater() {
    retry_ = loop_.at(loop_.now() + delay_, [this] {
        if (wanted() && !connection_)
            connect();
    });
    delay_ = std::min<std::chrono::milliseconds>(2 * delay_, longestDelay);
}

void SoundServer::watchIfWanted() {
    if (!connected_ || wanted() == watching_)
        return;
    watching_ = wanted();
    connection_->watch(watching_);
    if (!watching_)
        call_ = false;
}

void SoundServer::serverSurveyed(const SoundSurvey& survey) {
    later([survey](SoundServer& self) {
        if (!self.watching_)
            return;
        if (!survey.device)
            self.device_.reset();
        else if (!self.device_)
            self.lookForDevice();
        self.setCall(survey.call);
    });
}

void SoundServer::setCall(bool call) {
    if (std::exchange(call_, call) != call)
        tell(&SoundServerListener::callChanged);
}

// A listener may leave, and take others along, while it is told.
void SoundServer::tell(void (SoundServerListener::*what)()) {
    for (SoundServerListener* listener : std::set(listeners_))
        if (listeners_.contains(listener))
            (listener->*what)();
}

void SoundServer::refreshDevice(std::function<void()> done) {
    connection_->lookUpDevice([this, done = std::move(done)](std::optional<PcmFormat> format) {
        device_ = format;
        done();
    });
}

void SoundServer::playOut(std::unique_ptr<SoundStream> stream) {
    stream->setListener(noListener);
    const auto ending = endings_.insert(endings_.end(), {std::move(stream), nullptr});
    ending->timer = loop_.at(loop_.now() + timeToPlayOut, [this, ending] { endings_.erase(ending); });
}

} // namespace tarn
