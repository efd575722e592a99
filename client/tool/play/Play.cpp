#include "client/tool/play/Play.h"

#include <algorithm>
#include <iostream>

#include "client/tool/display/Columns.h"
#include "client/tool/display/Problem.h"
#include "client/tool/lists/Listing.h"
#include "client/tool/play/Background.h"
#include "client/tool/play/PlaySession.h"

namespace tarn::tool {

int runPlay(const PlayOptions& options) {
    auto listing = listFiles(options.names, std::cin);
    for (const auto& [name, reason] : listing.refused)
        std::cerr << "tarnctl: " << printable(std::string(name).append(": ").append(reason)) << std::endl;
    if (listing.files.empty())
        return 1;
    if (options.playback.rate < 0 && listing.files.size() > 1)
        throw Problem("only one file can be played backwards", "Name one, or give a --rate over 0.", 2);
    const bool listIsInput =
        std::find(options.names.begin(), options.names.end(), "-") != options.names.end();
    PlaySession::Options session{
        .socketPath = options.socketPath,
        .files = std::move(listing.files),
        .playback = options.playback,
        .keys = listIsInput ? Terminal::KeySource::terminal : Terminal::KeySource::standardInput,
        .hasFailedBefore = !listing.refused.empty(),
        .changed = {},
        .failed = {},
    };
    return options.isDetached ? playInBackground(std::move(session)) : PlaySession(std::move(session)).run();
}

} // namespace tarn::tool
