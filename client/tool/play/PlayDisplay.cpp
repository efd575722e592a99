#include "client/tool/play/PlayDisplay.h"

#include <unistd.h>

#include <iostream>
#include <utility>

namespace tarn::tool {

void PlayDisplay::tell(const std::string& line) const {
    if (!terminal_.isLive())
        std::cout << line << std::endl; // for whoever reads along
}

void PlayDisplay::say(const std::string& line) {
    if (!maySpeak())
        return;
    clear();
    std::cout << line << std::endl;
}

void PlayDisplay::complain(const std::string& line) {
    const bool isSeen = ::isatty(STDERR_FILENO) == 1;
    if (isSeen && !maySpeak()) {
        keptBack_.push_back(line);
        return;
    }
    if (isSeen)
        clear();
    std::cerr << "tarnctl: " << line << std::endl;
}

void PlayDisplay::show(const LiveState& state) {
    if (!terminal_.isLive() || !terminal_.isForeground())
        return;
    auto line = liveLine(state, terminal_.columns(), terminal_.hasColor());
    if (line != shown_)
        std::cout << "\r\x1b[K" << line << std::flush;
    shown_ = std::move(line);
}

void PlayDisplay::clear() {
    shown_.clear();
    if (terminal_.isLive() && terminal_.isForeground())
        std::cout << "\r\x1b[K" << std::flush;
}

void PlayDisplay::catchUp() {
    for (const auto& line : std::exchange(keptBack_, {}))
        complain(line);
}

} // namespace tarn::tool
