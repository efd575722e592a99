#include <cstdint>
#include <cstdlib>

#include "controls/applications/DesktopEntry.h"
#include "controls/applications/Metainfo.h"

/// Any program may install what it likes: a desktop entry or metadata of anything at all costs only itself.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text(reinterpret_cast<const char*>(data), size);
    if (const auto entry = tarn::parseDesktopEntry(text))
        tarn::nameInLanguages(*entry, {"de_DE", "de", "C"});
    if (const auto component = tarn::parseMetainfo(text))
        for (const auto& name : component->desktopEntries)
            if (name.size() > size || tarn::withoutDesktopSuffix(name) != name)
                std::abort();
    return 0;
}
