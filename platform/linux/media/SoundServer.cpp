#include "platform/linux/media/SoundServer.h"

#include <pulse/pulseaudio.h>

#include <algorithm>

#include "platform/SystemLog.h"
#include "platform/linux/media/PulseFormat.h"

namespace tarn {

namespace {

using namespace std::chrono_literals;
constexpr auto firstDelay = 200ms;
constexpr auto longestDelay = 1500ms;

} // namespace

struct SoundServer::FormatQuery {
    std::weak_ptr<SoundServer*> server;
    std::function<void()> done;

    static void answered(pa_context*, const pa_sink_info* sink, int end, void* data) {
        auto* query = static_cast<FormatQuery*>(data);
        const auto server = query->server.lock();
        if (server && sink != nullptr)
            (*server)->format_ = formatOf(sink->sample_spec);
        if (end == 0)
            return;
        const std::unique_ptr<FormatQuery> owned(query);
        if (server && (*server)->ready())
            owned->done();
    }
};

void SoundServer::ContextDelete::operator()(pa_context* context) const {
    pa_context_set_state_callback(context, nullptr, nullptr);
    pa_context_disconnect(context);
    pa_context_unref(context);
}

SoundServer::SoundServer(LinuxPlayerLoop& loop)
    : loop_(loop), delay_(firstDelay), self_(std::make_shared<SoundServer*>(this)) {}

SoundServer::~SoundServer() = default;

void SoundServer::remove(SoundServerListener& listener) {
    listeners_.erase(&listener);
    unwant(listener);
}

void SoundServer::want(SoundServerListener& listener) {
    wanting_.insert(&listener);
    if (!context_) {
        delay_ = firstDelay;
        connect();
    }
}

void SoundServer::connect() {
    retry_.reset();
    pa_proplist* properties = pa_proplist_new();
    pa_proplist_sets(properties, PA_PROP_APPLICATION_NAME, "tarnd");
    pa_proplist_sets(properties, PA_PROP_APPLICATION_ID, applicationId);
    pa_proplist_sets(properties, PA_PROP_APPLICATION_ICON_NAME, "audio-x-generic");
    context_.reset(pa_context_new_with_proplist(&loop_.api(), "tarnd", properties));
    pa_proplist_free(properties);
    pa_context_set_state_callback(
        context_.get(), [](pa_context*, void* self) { static_cast<SoundServer*>(self)->stateChanged(); },
        this);
    // A failure is told through the state, at once or later.
    pa_context_connect(context_.get(), nullptr, PA_CONTEXT_NOAUTOSPAWN, nullptr);
}

// The library is in the middle of something: what follows is done from the loop.
void SoundServer::stateChanged() {
    const pa_context_state_t state = pa_context_get_state(context_.get());
    std::weak_ptr<SoundServer*> weak = self_;
    const auto later = [&](void (SoundServer::*what)()) {
        loop_.post([weak, what, context = context_.get()] {
            if (const auto server = weak.lock(); server && (*server)->context_.get() == context)
                ((*server)->*what)();
        });
    };
    if (state == PA_CONTEXT_READY)
        later(&SoundServer::found);
    else if (!PA_CONTEXT_IS_GOOD(state))
        later(&SoundServer::lost);
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
    context_.reset();
    if (!std::exchange(missed_, true))
        SystemLog::error("-[SoundServer lost]", __LINE__,
                         "%{public}s:%d: No sound server: playing in silence until it is there.");
    if (!wanting_.empty())
        retryLater();
    tell(&SoundServerListener::soundServerLost);
}

void SoundServer::retryLater() {
    retry_ = loop_.at(loop_.now() + delay_, [this] {
        if (!wanting_.empty() && !context_)
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
    auto* query = new FormatQuery{self_, std::move(done)}; // answered() owns it
    pa_operation* operation =
        pa_context_get_sink_info_by_name(context_.get(), "@DEFAULT_SINK@", FormatQuery::answered, query);
    if (operation == nullptr)
        delete query;
    else
        pa_operation_unref(operation);
}

} // namespace tarn
