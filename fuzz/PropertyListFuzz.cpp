#include <cstdint>
#include <cstdlib>

#include "client/libtarn/ErrorTexts.h"
#include "wire/PropertyList.h"
#include "wire/Utf8.h"

/// What is read of a property list of anything at all are texts, and what we write of them is read back as it
/// was.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto texts = tarn::readErrorTexts({data, size});
    for (const auto& [key, text] : texts)
        if (!tarn::isValidUtf8(key) || !tarn::isValidUtf8(text))
            std::abort();
    if (tarn::readErrorTexts(*tarn::binaryPropertyList(texts).data) != texts)
        std::abort();
    return 0;
}
