#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace tarn {

/// The absolute path that a `file:` URL of this machine (no host, or localhost) names, percent-decoded. None
/// for every other URL, and for a path that holds a NUL.
std::optional<std::string> pathFromFileURL(std::string_view URL);

} // namespace tarn
