#pragma once

#include <string>

namespace tarn {

/// The last path component of a URL, extension included, as a person would write it: percent-encoding undone
/// unless the result would not be text. Empty when the URL has no path.
std::string fileNameOfURL(const std::string& URL);

} // namespace tarn
