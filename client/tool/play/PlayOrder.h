#pragma once

#include <cstddef>
#include <optional>
#include <random>
#include <vector>

namespace tarn::tool {

/// In which order the files of a list have their turn: as they come or shuffled, once or round after round.
class PlayOrder {
public:
    struct Options {
        bool isShuffled = false; // each round anew
        bool isLooped = false;
    };
    struct Turn {
        std::size_t file;
        std::size_t number; // within the round, from 1
    };

    PlayOrder(std::size_t files, Options options, unsigned seed = std::random_device()());

    /// Whose turn it is; none when all had theirs.
    std::optional<Turn> next();

    /// It cannot be played, and gets no other turn.
    void leaveOut(std::size_t file);

    /// Files of the list.
    std::size_t size() const { return isLeftOut_.size(); }

private:
    void beginRound();

    const Options options_;
    std::mt19937 random_;
    std::vector<std::size_t> round_;
    std::size_t taken_ = 0; // of the round
    std::vector<bool> isLeftOut_;
    std::size_t playable_;
};

} // namespace tarn::tool
