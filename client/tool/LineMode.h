#pragma once

#include <istream>
#include <string>
#include <vector>

#include "client/tool/display/OutputLine.h"

namespace tarn::tool {

/// The line mode: sends commands, prints every answer and event as one line.
struct LineModeOptions {
    std::string socketPath;
    std::vector<std::string> lines; // commands, one each; none: they are read from standard input
    LineFormat format = LineFormat::text;
    bool follow = false; // print events until the connection ends
};

/// Beside the commands there are: `grant token=T path=P`, `wait` (for the ends of the commands before), and
/// `wait EVENT [FIELD=VALUE]...`. Returns the exit status: 1 when a line could not be understood or a command
/// failed, or the connection was lost while something was awaited.
int runLineMode(const LineModeOptions& options);

} // namespace tarn::tool
