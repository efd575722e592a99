#include "localization/BundleText.h"

namespace tarn {

std::string textOfBundle(const Bundle& bundle, const Localization& localization, const std::string& key,
                         const std::string& defaultValue, const std::string& table) {
    constexpr const char* developmentLanguage = "en";
    auto languages =
        localization.preferredLocalizations(bundle.localizations(), localization.preferredLanguages());
    languages.emplace_back(developmentLanguage);
    for (const std::string& language : languages) {
        const auto path = bundle.pathForResource(table, "strings", language);
        const auto strings = path ? localization.readStringsFile(*path) : std::nullopt;
        if (!strings)
            continue;
        if (const auto entry = strings->find(key); entry != strings->end())
            return entry->second;
    }
    return defaultValue.empty() ? key : defaultValue;
}

} // namespace tarn
