#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace tarn::tool {

/// The entries of a playlist in their order, as they are written: paths and URLs. An .m3u has one on each
/// line, and so has what other programs write for this one to read; they may be separated by NULs instead, as
/// "find -print0" does. A .pls numbers its entries.
std::vector<std::string> playlistEntries(std::string_view text);

} // namespace tarn::tool
