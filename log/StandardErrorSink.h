#pragma once

#include "log/LossyLogSink.h"

namespace tarn {

/// Writes each record as one line to standard error, or to another descriptor of a file, pipe, terminal or
/// socket. Programs that read the lines find the priority in front; on a terminal it is left out.
class StandardErrorSink final : public LossyLogSink {
public:
    /// The descriptor stays the caller's and must outlive the sink.
    explicit StandardErrorSink(int descriptor = 2);

private:
    bool take(const LogRecord& record) override;

    const int descriptor_;
    const bool isTerminal_;
};

} // namespace tarn
