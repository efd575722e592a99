#include "log/SystemSink.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <string>
#include <utility>

#include "log/JournalSink.h"
#include "log/StandardErrorSink.h"

namespace tarn {

namespace {

/// The variable is inherited by programs whose standard error leads elsewhere: it names the stream that it is
/// about.
bool standardErrorIsTheJournal() {
    const char* stream = std::getenv("JOURNAL_STREAM"); // NOLINT(concurrency-mt-unsafe): nobody sets it
    struct stat status {};
    return stream != nullptr && ::fstat(STDERR_FILENO, &status) == 0 &&
           stream == std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
}

} // namespace

std::shared_ptr<LogSink> systemSink(std::string identifier) {
    auto standardError = std::make_shared<StandardErrorSink>();
    if (!standardErrorIsTheJournal())
        return standardError;
    // The journal's own protocol keeps the fields of a record.
    return std::make_shared<JournalSink>(std::move(identifier), std::move(standardError));
}

} // namespace tarn
