#pragma once

#include <string_view>
#include <vector>

namespace tarn::tool {

/// What a person can press while something plays.
enum class Key { pause, next, seekBack, seekForward, slower, faster, quit };

/// The key presses that a terminal has sent. Those that mean nothing here are left out.
std::vector<Key> keysIn(std::string_view sent);

} // namespace tarn::tool
