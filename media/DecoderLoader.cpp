#include "media/DecoderLoader.h"

#include "log/SystemLog.h"
#include "system/ModuleFile.h"

namespace tarn {

const DecoderModule* DecoderLoader::load() {
    std::lock_guard lock(mutex_);
    if (module_ != nullptr)
        return module_;
    const auto [function, error] = loadFromModule(decoderModuleFile, decoderModuleSymbol);
    if (function != nullptr)
        module_ = reinterpret_cast<DecoderModuleFunction>(function)();
    else
        SystemLog::error("DecoderLoader::load", __LINE__,
                         "%{public}s:%d: Could not load %{public}s: %{public}s", decoderModuleFile,
                         error.c_str());
    return module_;
}

} // namespace tarn
