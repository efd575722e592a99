#pragma once

#include <string>

#include "log/LossyLogSink.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// Writes each record as one line to standard error, or to another descriptor of a file, pipe, terminal or
/// socket. Programs that read the lines find the priority in front; on a terminal it is left out.
class StandardErrorSink final : public LossyLogSink {
public:
    /// The descriptor stays the caller's and must outlive the sink.
    explicit StandardErrorSink(int descriptor = 2);

private:
    bool take(const LogRecord& record) override;
    ssize_t writeNow(const std::string& text) const;

    const int descriptor_;
    const bool isTerminal_;
    /// The same pipe or terminal, opened anew: it never waits, and the programs that share `descriptor_` do
    /// not notice. None of anything else.
    const FileDescriptor own_;
    std::string unfinished_; // a terminal may take a part of a line: the rest comes first when it takes more
};

} // namespace tarn
