#pragma once

#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "log/SystemLog.h"

namespace tarn {

/// Catches every log line of the process while it lives; then the sink before is back.
///
/// Lines may be written and read on any thread. A line that was begun before the end may still arrive
/// afterwards.
class CapturedLog final {
public:
    struct Line {
        LogLevel level;
        LogCategory category;
        std::string method;
        int line;
        std::string message;
    };

    CapturedLog();
    ~CapturedLog();

    CapturedLog(const CapturedLog&) = delete;
    CapturedLog& operator=(const CapturedLog&) = delete;

    std::vector<Line> lines() const;
    std::vector<std::string> messages() const;
    std::vector<std::string> errors() const;

    /// Waits until a message holds `text`; false when the limit passed without one.
    [[nodiscard]] bool waitFor(std::string_view text,
                               std::chrono::milliseconds limit = std::chrono::seconds(10)) const;

private:
    class Sink;

    std::vector<std::string> messagesWhere(bool errorsOnly) const;

    std::shared_ptr<Sink> sink_;
    std::shared_ptr<LogSink> sinkBefore_;
};

} // namespace tarn
