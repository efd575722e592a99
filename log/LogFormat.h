#pragma once

#include <initializer_list>
#include <string>
#include <string_view>

#include "log/SystemLog.h"

namespace tarn {

/// Fills the placeholders of `format` with `method`, `line` and then `arguments`, in order.
///
/// The result is one line of valid UTF-8 of at most `logMessageLimit` bytes, whatever the arguments hold:
/// what would break or disguise a line is written as an escape ("\n", "\u{202e}"), a byte that is no UTF-8 as
/// U+FFFD, and a text of more than `logTextLimit` bytes is cut and ends in "...".
/// A placeholder without an argument becomes "<missing>".
std::string formatLogMessage(std::string_view method, int line, std::string_view format,
                             std::initializer_list<LogArgument> arguments);

inline constexpr std::size_t logTextLimit = 1000;
inline constexpr std::size_t logMessageLimit = 3000;

} // namespace tarn
