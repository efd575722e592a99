#include "platform/linux/media/DecoderLoader.h"

#include "platform/linux/media/ModuleFile.h"

namespace tarn {

const DecoderModule* DecoderLoader::load() {
    std::lock_guard lock(mutex_);
    if (module_ == nullptr)
        if (void* function = loadFromModule(decoderModuleFile, decoderModuleSymbol))
            module_ = reinterpret_cast<DecoderModuleFunction>(function)();
    return module_;
}

} // namespace tarn
