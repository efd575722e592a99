#pragma once

#include "client/tool/play/PlaySession.h"

namespace tarn::tool {

/// Plays in a process of its own, which goes on when this one has ended and the terminal is gone: the owner
/// of the queue. Returns as soon as it sounds, or with its exit status when it never does. There is one such
/// process at most: it takes the place of the one before.
int playInBackground(PlaySession::Options options);

} // namespace tarn::tool
