#pragma once

#include <memory>
#include <string>

#include "platform/SystemLog.h"

namespace tarn {

/// The system journal, or standard error while there is none. `identifier` is the name of the program in the
/// journal.
std::shared_ptr<LogSink> systemSink(std::string identifier);

} // namespace tarn
