#pragma once

#include <string>

namespace tarn {

/// 128 random bits as text: nobody guesses it, and nobody else uses it. Throws std::system_error.
std::string makeToken();

} // namespace tarn
