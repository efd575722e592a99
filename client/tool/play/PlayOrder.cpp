#include "client/tool/play/PlayOrder.h"

#include <algorithm>
#include <numeric>

namespace tarn::tool {

PlayOrder::PlayOrder(std::size_t files, Options options, unsigned seed)
    : options_(options), random_(seed), round_(files), isLeftOut_(files), playable_(files) {
    std::iota(round_.begin(), round_.end(), std::size_t{0});
    beginRound();
}

void PlayOrder::beginRound() {
    taken_ = 0;
    if (!options_.isShuffled || round_.empty())
        return;
    const auto last = round_.back();
    std::shuffle(round_.begin(), round_.end(), random_);
    if (round_.front() == last) // does not follow itself
        std::swap(round_.front(), round_.back());
}

std::optional<PlayOrder::Turn> PlayOrder::next() {
    while (playable_ > 0) {
        if (taken_ == round_.size()) {
            if (!options_.isLooped)
                return std::nullopt;
            beginRound();
        }
        const auto file = round_[taken_++];
        if (!isLeftOut_[file])
            return Turn{file, taken_};
    }
    return std::nullopt;
}

void PlayOrder::leaveOut(std::size_t file) {
    if (isLeftOut_[file])
        return;
    isLeftOut_[file] = true;
    --playable_;
}

} // namespace tarn::tool
