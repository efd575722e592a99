#include "log/SystemLog.h"

#include <cstdio>
#include <mutex>
#include <utility>

#include "log/LogFormat.h"
#include "log/LogLine.h"

namespace tarn {

namespace {

/// Where lines go until the program has chosen its sink.
class FirstSink final : public LogSink {
public:
    void write(const LogRecord& record) override {
        const std::string line = standardErrorLine(record);
        std::fwrite(line.data(), 1, line.size(), stderr);
    }
};

struct CurrentSink {
    std::mutex mutex;
    std::shared_ptr<LogSink> sink = std::make_shared<FirstSink>();
};

/// Never destroyed: threads may still log while the process ends.
CurrentSink& currentSink() {
    static auto& current = *new CurrentSink;
    return current;
}

} // namespace

void SystemLog::write(LogLevel level, LogCategory category, std::string_view method, int line,
                      std::string_view format, std::initializer_list<LogArgument> arguments) {
    std::shared_ptr<LogSink> sink;
    {
        const std::lock_guard lock(currentSink().mutex);
        sink = currentSink().sink;
    }
    const std::string message = formatLogMessage(method, line, format, arguments);
    sink->write({level, category, method, line, message});
}

std::shared_ptr<LogSink> SystemLog::setSink(std::shared_ptr<LogSink> sink) {
    const std::lock_guard lock(currentSink().mutex);
    return std::exchange(currentSink().sink, std::move(sink));
}

} // namespace tarn
