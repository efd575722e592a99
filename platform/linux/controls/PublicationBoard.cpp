#include "platform/linux/controls/PublicationBoard.h"

namespace tarn {

void PublicationBoard::setApplication(std::optional<std::string> application) {
    const std::lock_guard lock(mutex_);
    application_ = std::move(application);
    if (application_ || !current_.application)
        return;
    current_.application.reset();
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
