#pragma once

namespace tarn {

/// The function `symbol` of the module `file`, a library that is loaded when it is first needed because it is
/// large. Null, with one error line that says why, when it cannot be loaded. Once loaded a module stays. Any
/// thread may call.
void* loadFromModule(const char* file, const char* symbol);

} // namespace tarn
