#pragma once

#include <memory>
#include <string>

#include "log/LossyLogSink.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// Writes each record to the system journal, with its fields. Without a journal it goes to the fallback.
///
/// Speaks the journal's datagram protocol itself, because sd_journal_sendv() waits for ever once the journal
/// has stopped reading.
class JournalSink final : public LossyLogSink {
public:
    /// `identifier` is the name of the program in the journal.
    JournalSink(std::string identifier, std::shared_ptr<LogSink> fallback,
                std::string socketPath = "/run/systemd/journal/socket");

private:
    bool take(const LogRecord& record) override;

    const std::string identifier_;
    const std::shared_ptr<LogSink> fallback_;
    const std::string socketPath_;
    const FileDescriptor socket_;
};

} // namespace tarn
