#include "mediaprotocol/Messages.h"

namespace tarn {

std::string lockDownText(std::uint32_t locks) {
    if (locks == lockedEverything)
        return "system calls and memory are limited";
    if (locks == lockedSystemCalls)
        return "system calls are limited, memory is not";
    if (locks == lockedMemory)
        return "memory is limited, system calls are not";
    return "neither system calls nor memory are limited";
}

} // namespace tarn
