#pragma once

#include <concepts>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>

namespace tarn {

enum class LogLevel { standard, error };

/// The categories of the subsystem "ostrel.pellion".
enum class LogCategory { standard, extensionLoading, backgroundAppRefresh };

/// One argument of a log line. An absent text is written as "(null)".
class LogArgument {
public:
    LogArgument(std::string_view text) : value_(text) {}
    LogArgument(const std::string& text) : value_(std::string_view(text)) {}
    LogArgument(const char* text) : value_(text ? std::string_view(text) : absent) {}
    LogArgument(const std::optional<std::string>& text) : value_(text ? std::string_view(*text) : absent) {}
    LogArgument(const void* address) : value_(address) {}
    LogArgument(double number) : value_(number) {}
    template <std::integral T>
    LogArgument(T number) : value_(static_cast<std::int64_t>(number)) {}

    const std::variant<std::string_view, const void*, double, std::int64_t>& value() const { return value_; }

private:
    static constexpr std::string_view absent = "(null)";

    std::variant<std::string_view, const void*, double, std::int64_t> value_;
};

/// One finished line; `message` begins with the method and the line, and is one line of valid UTF-8 of at
/// most 3,000 bytes.
struct LogRecord {
    LogLevel level;
    LogCategory category;
    std::string_view method;
    int line;
    std::string_view message;
};

/// Where finished lines go. write() may be called from any thread and does not block for long.
class LogSink {
public:
    virtual ~LogSink() = default;
    virtual void write(const LogRecord& record) = 0;
};

/// The system log, the one thing that is process-wide. Any thread may call.
///
/// A format holds "%@", "%s", "%d", "%p" and the like, each maybe with "{public}" behind the percent sign.
/// Text that is not marked public is written as "<private>"; numbers and addresses are public. Every format
/// begins with "%{public}s:%d: ", which is filled with the emitting method and a source line. One call makes
/// one line, whatever the arguments hold.
class SystemLog {
public:
    template <class... Arguments>
    static void error(std::string_view method, int line, std::string_view format,
                      const Arguments&... arguments) {
        write(LogLevel::error, LogCategory::standard, method, line, format, {LogArgument(arguments)...});
    }

    template <class... Arguments>
    static void message(std::string_view method, int line, std::string_view format,
                        const Arguments&... arguments) {
        write(LogLevel::standard, LogCategory::standard, method, line, format, {LogArgument(arguments)...});
    }

    static void write(LogLevel level, LogCategory category, std::string_view method, int line,
                      std::string_view format, std::initializer_list<LogArgument> arguments);

    /// Sends lines to `sink` from now on and returns the sink before. The first sink writes to standard
    /// error.
    static std::shared_ptr<LogSink> setSink(std::shared_ptr<LogSink> sink);
};

} // namespace tarn
