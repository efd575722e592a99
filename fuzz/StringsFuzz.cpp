#include <cstdint>
#include <cstdlib>

#include "localization/StringsFile.h"
#include "wire/Utf8.h"

/// Anything at all may stand in a strings file; what is read from it is text.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto strings = tarn::parseStringsFile({reinterpret_cast<const char*>(data), size});
    if (!strings)
        return 0;
    for (const auto& [key, text] : *strings)
        if (!tarn::isValidUtf8(key) || !tarn::isValidUtf8(text))
            std::abort();
    return 0;
}
