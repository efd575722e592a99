#include "controls/BusLoop.h"

#include <cassert>
#include <cerrno>
#include <cstdint>
#include <system_error>
#include <utility>

#include <pthread.h>
#include <sys/eventfd.h>
#include <unistd.h>

namespace tarn {

namespace {

void require(int result, const char* what) {
    if (result < 0)
        throw std::system_error(-result, std::generic_category(), what);
}

} // namespace

BusLoop::BusLoop() : wakeup_(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
    if (!wakeup_)
        throw std::system_error(errno, std::generic_category(), "eventfd");
    sd_event* event = nullptr;
    require(sd_event_new(&event), "sd_event_new");
    event_.reset(event);
    sd_event_source* source = nullptr;
    const auto wake = [](sd_event_source*, int, std::uint32_t, void* loop) {
        static_cast<BusLoop*>(loop)->drain();
        return 0;
    };
    require(sd_event_add_io(event, &source, wakeup_.get(), EPOLLIN, wake, this), "sd_event_add_io");
    wakeupSource_.reset(source);
}

BusLoop::~BusLoop() { stop(); }

void BusLoop::start() {
    assert(!thread_.joinable());
    thread_ = std::thread([this] { run(); });
}

void BusLoop::stop() {
    if (!thread_.joinable())
        return;
    assert(thread_.get_id() != std::this_thread::get_id());
    post([this] { ending_ = true; });
    thread_.join();
}

void BusLoop::post(std::function<void()> work) {
    {
        const std::lock_guard lock(mutex_);
        posted_.push_back(std::move(work));
        if (posted_.size() > 1)
            return; // the wake-up for the first one is still to come
    }
    const std::uint64_t one = 1;
    [[maybe_unused]] const auto written = ::write(wakeup_.get(), &one, sizeof one);
}

void BusLoop::run() {
    pthread_setname_np(pthread_self(), "bus");
    while (!ending_)
        sd_event_run(event_.get(), UINT64_MAX);
}

void BusLoop::drain() {
    std::uint64_t count = 0;
    [[maybe_unused]] const auto taken = ::read(wakeup_.get(), &count, sizeof count);
    std::vector<std::function<void()>> work;
    {
        const std::lock_guard lock(mutex_);
        work.swap(posted_);
    }
    for (const auto& piece : work)
        piece();
}

} // namespace tarn
