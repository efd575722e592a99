#pragma once

#include <string_view>

namespace tarn::tool {

/// Sorts names as people count: "Track 2" before "Track 10", "a" beside "A". A total order: two different
/// names are never equal.
bool comesBefore(std::string_view name, std::string_view other);

} // namespace tarn::tool
