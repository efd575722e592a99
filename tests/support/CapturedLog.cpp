#include "tests/support/CapturedLog.h"

#include <algorithm>
#include <utility>

namespace tarn {

class CapturedLog::Sink final : public LogSink {
public:
    void write(const LogRecord& record) override {
        const std::lock_guard lock(mutex);
        lines.push_back({record.level, record.category, std::string(record.method), record.line,
                         std::string(record.message)});
        changed.notify_all();
    }

    std::mutex mutex;
    std::condition_variable changed;
    std::vector<Line> lines;
};

CapturedLog::CapturedLog() : sink_(std::make_shared<Sink>()), sinkBefore_(SystemLog::setSink(sink_)) {}

CapturedLog::~CapturedLog() { SystemLog::setSink(std::move(sinkBefore_)); }

std::vector<CapturedLog::Line> CapturedLog::lines() const {
    const std::lock_guard lock(sink_->mutex);
    return sink_->lines;
}

std::vector<std::string> CapturedLog::messages() const { return messagesWhere(false); }

std::vector<std::string> CapturedLog::errors() const { return messagesWhere(true); }

std::vector<std::string> CapturedLog::messagesWhere(bool errorsOnly) const {
    std::vector<std::string> messages;
    for (const Line& line : lines())
        if (!errorsOnly || line.level == LogLevel::error)
            messages.push_back(line.message);
    return messages;
}

bool CapturedLog::waitFor(std::string_view text, std::chrono::milliseconds limit) const {
    std::unique_lock lock(sink_->mutex);
    return sink_->changed.wait_for(lock, limit, [&] {
        return std::ranges::any_of(
            sink_->lines, [&](const Line& line) { return line.message.find(text) != line.message.npos; });
    });
}

} // namespace tarn
