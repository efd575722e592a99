#include "platform/linux/log/SystemSink.h"

#include <utility>

#include "platform/linux/log/JournalSink.h"
#include "platform/linux/log/StandardErrorSink.h"

namespace tarn {

std::shared_ptr<LogSink> systemSink(std::string identifier) {
    return std::make_shared<JournalSink>(std::move(identifier), std::make_shared<StandardErrorSink>());
}

} // namespace tarn
