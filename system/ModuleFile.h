#pragma once

#include <optional>
#include <string>

namespace tarn {

/// The full path of `file`, which is installed beside the modules; none when it is not there.
std::optional<std::string> findBesideModules(const char* file);

/// What was found in a module: its function, or why there is none.
struct ModuleSymbol {
    void* function = nullptr;
    std::string error; ///< empty when there is a function
};

/// Loads the module `file`, a library beside the program that is loaded when it is first needed because it is
/// large, and finds `symbol` in it. Once loaded a module stays. Any thread may call.
ModuleSymbol loadFromModule(const char* file, const char* symbol);

} // namespace tarn
