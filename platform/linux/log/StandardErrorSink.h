#pragma once

#include "platform/linux/log/LossyLogSink.h"

namespace tarn {

/// Writes each record as one line to standard error, or to another descriptor of a file, pipe, terminal or
/// socket.
class StandardErrorSink final : public LossyLogSink {
public:
    /// The descriptor stays the caller's and must outlive the sink.
    explicit StandardErrorSink(int descriptor = 2) : descriptor_(descriptor) {}

private:
    bool take(const LogRecord& record) override;

    const int descriptor_;
};

} // namespace tarn
