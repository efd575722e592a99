#include "controls/PublicationBoard.h"

#include <utility>

namespace tarn {

PublicationBoard::PublicationBoard(ApplicationLabel application, std::function<void()> wake)
    : wake_(std::move(wake)), application_(std::move(application)) {
    current_.application = application_;
}

void PublicationBoard::setApplication(ApplicationLabel application) {
    const std::lock_guard lock(mutex_);
    application_ = std::move(application);
}

void PublicationBoard::replaceApplication(ApplicationLabel application) {
    const std::lock_guard lock(mutex_);
    application_ = std::move(application);
    if (current_.application == application_)
        return;
    current_.application = application_;
    wake();
}

void PublicationBoard::publish(const NowPlayingInfo& info) {
    const std::lock_guard lock(mutex_);
    current_.info = info;
    current_.time = std::chrono::steady_clock::now();
    current_.application = application_;
    ++current_.number;
    wake();
}

void PublicationBoard::touch() {
    const std::lock_guard lock(mutex_);
    wake();
}

void PublicationBoard::close() {
    const std::lock_guard lock(mutex_);
    wake_ = nullptr;
}

PublicationBoard::Snapshot PublicationBoard::take() {
    const std::lock_guard lock(mutex_);
    woken_ = false;
    return current_;
}

/// The mutex is held: wake_ only posts to the bus thread, which takes no lock while it calls anything.
void PublicationBoard::wake() {
    if (woken_ || !wake_)
        return;
    woken_ = true;
    wake_();
}

} // namespace tarn
