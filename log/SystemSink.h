#pragma once

#include <memory>
#include <string>

#include "log/SystemLog.h"

namespace tarn {

/// Where the lines of a program go: to the journal when the service manager has started it so, and to
/// standard error when it was started by hand. `identifier` is the program's name in the journal.
std::shared_ptr<LogSink> systemSink(std::string identifier);

} // namespace tarn
