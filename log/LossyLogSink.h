#pragma once

#include <cstddef>
#include <mutex>

#include "log/SystemLog.h"

namespace tarn {

/// A sink that loses a line rather than wait for its reader, and tells the number of lost lines in front of
/// the next one that gets through.
class LossyLogSink : public LogSink {
public:
    void write(const LogRecord& record) final;

private:
    /// False when the line was not taken; never waits. One call at a time.
    virtual bool take(const LogRecord& record) = 0;

    bool tellLost();

    std::mutex mutex_;
    std::size_t lost_ = 0;
};

} // namespace tarn
