#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
} // namespace CLI

namespace tarn::tool {

/// Prints what the last of the words behind "tarnctl", which may be empty, can become: on each line a word, a
/// tab and a description, or the line ":files" where any file may stand. Returns the exit status.
int runComplete(const CLI::App& commandLine, const std::vector<std::string>& words);

} // namespace tarn::tool
