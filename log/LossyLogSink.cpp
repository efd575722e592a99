#include "log/LossyLogSink.h"

#include <string>
#include <string_view>

#include "log/LogFormat.h"

namespace tarn {

void LossyLogSink::write(const LogRecord& record) {
    const std::lock_guard lock(mutex_);
    if (!tellLost() || !take(record))
        ++lost_;
}

bool LossyLogSink::tellLost() {
    if (lost_ == 0)
        return true;
    constexpr std::string_view method = "-[LossyLogSink tellLost]";
    constexpr int line = __LINE__;
    const std::string message = formatLogMessage(
        method, line, "%{public}s:%d: %d lines are missing here: nobody read the log in time", {lost_});
    if (!take({LogLevel::error, LogCategory::standard, method, line, message}))
        return false;
    lost_ = 0;
    return true;
}

} // namespace tarn
