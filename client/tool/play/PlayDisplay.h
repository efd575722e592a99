#pragma once

#include <string>
#include <vector>

#include "client/tool/display/LiveLine.h"
#include "client/tool/display/Terminal.h"

namespace tarn::tool {

/// What "play" shows: on a terminal one line that changes, elsewhere a line for each thing that happens. In
/// the background it writes nothing to the terminal; what went wrong meanwhile is told in the foreground.
class PlayDisplay {
public:
    explicit PlayDisplay(Terminal& terminal) : terminal_(terminal) {}

    /// News that the live line shows by itself.
    void tell(const std::string& line) const;
    /// What everybody should read.
    void say(const std::string& line);
    /// What went wrong; to standard error.
    void complain(const std::string& line);

    void show(const LiveState& state);
    /// Takes the live line away, for what is to stand in its place.
    void clear();
    /// Tells what was kept back in the background.
    void catchUp();

private:
    bool maySpeak() const { return !terminal_.isLive() || terminal_.isForeground(); }

    Terminal& terminal_;
    std::string shown_; // the live line as it stands there
    std::vector<std::string> keptBack_;
};

} // namespace tarn::tool
