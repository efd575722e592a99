#pragma once

#include <functional>

namespace tarn::tool {

/// What the command line asks for: to be called for the exit status. What is wrong with it, and what --help
/// and
/// --version ask for, has been printed; the status of those is given back then.
std::function<int()> parseCommandLine(int argc, char** argv);

} // namespace tarn::tool
