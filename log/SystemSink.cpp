#include "log/SystemSink.h"

#include <cstdlib>
#include <utility>

#include "log/JournalSink.h"
#include "log/StandardErrorSink.h"

namespace tarn {

std::shared_ptr<LogSink> systemSink(std::string identifier) {
    auto standardError = std::make_shared<StandardErrorSink>();
    // Set when standard error leads to the journal; the journal's own protocol keeps the fields of a record.
    if (std::getenv("JOURNAL_STREAM") == nullptr) // NOLINT(concurrency-mt-unsafe): nobody sets it
        return standardError;
    return std::make_shared<JournalSink>(std::move(identifier), std::move(standardError));
}

} // namespace tarn
