#include "log/LogLine.h"

namespace tarn {

std::string_view logCategoryName(LogCategory category) noexcept {
    switch (category) {
    case LogCategory::extensionLoading:
        return "extension_loading";
    case LogCategory::backgroundAppRefresh:
        return "bg_app_refresh";
    case LogCategory::standard:
        break;
    }
    return "default";
}

int logPriority(LogLevel level) noexcept {
    constexpr int error = 3;
    constexpr int informational = 6;
    return level == LogLevel::error ? error : informational;
}

std::string standardErrorLine(const LogRecord& record) {
    std::string line = "<" + std::to_string(logPriority(record.level)) + ">";
    line += record.message;
    line += '\n';
    return line;
}

} // namespace tarn
