#pragma once

#include <string>
#include <string_view>

#include "log/SystemLog.h"

namespace tarn {

inline constexpr std::string_view logSubsystem = "ostrel.pellion";

/// The name of the category's handle.
std::string_view logCategoryName(LogCategory category) noexcept;

/// The severity as syslog numbers it.
int logPriority(LogLevel level) noexcept;

/// The record as standard error takes it: "<3>message" and a line feed. The number in front is read, and
/// taken off, by a journal that standard error is connected to.
std::string standardErrorLine(const LogRecord& record);

} // namespace tarn
