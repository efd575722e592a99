#include "controls/PublicationBoard.h"

#include <utility>

namespace tarn {

PublicationBoard::PublicationBoard(ApplicationLabel application, std::function<void()> wake)
    : wake_(std::move(wake)), set_{{}, std::move(application)}, shown_(set_) {}

void PublicationBoard::setApplication(ApplicationLabel application) {
    const std::lock_guard lock(mutex_);
    set_.application = std::move(application);
}

void PublicationBoard::setInfo(const NowPlayingInfo& info) {
    const std::lock_guard lock(mutex_);
    set_.info = info;
}

void PublicationBoard::show() {
    const std::lock_guard lock(mutex_);
    shown_ = set_;
}

/// wake_ only posts to the bus thread, which takes no lock while it calls anything.
void PublicationBoard::touch() {
    const std::lock_guard lock(mutex_);
    if (woken_ || !wake_)
        return;
    woken_ = true;
    wake_();
}

void PublicationBoard::close() {
    const std::lock_guard lock(mutex_);
    wake_ = nullptr;
}

PublicationBoard::Publication PublicationBoard::take() {
    const std::lock_guard lock(mutex_);
    woken_ = false;
    return shown_;
}

} // namespace tarn
