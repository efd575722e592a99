#include "reply/LocalizedString.h"

#include "log/SystemLog.h"

namespace tarn {

namespace {

constexpr const char* table = "Localizable";

std::optional<std::string> textInLanguage(const Localization& localization, const Bundle& bundle,
                                          const std::string& key, const std::string& language) {
    const auto matches = localization.preferredLocalizations(bundle.localizations(), {language});
    if (matches.empty())
        return std::nullopt;
    const auto path = bundle.pathForResource(table, "strings", matches.front());
    if (!path || !localization.fileExists(*path))
        return std::nullopt;
    const auto strings = localization.readStringsFile(*path);
    if (!strings)
        return std::nullopt;
    const auto entry = strings->find(key);
    return entry == strings->end() ? std::nullopt : std::optional(entry->second);
}

} // namespace

std::string vlUtils_localizedStringForSystemLanguage(const Localization& localization, const std::string& key,
                                                     const std::string& bundlePath) {
    const auto bundle = localization.openBundle(bundlePath);
    if (!bundle) {
        SystemLog::error("vlUtils_localizedStringForSystemLanguage", 155,
                         "%{public}s:%d: Failed to localize key \"%{public}@\" in bundle at %{public}@. "
                         "bundleExists=%d",
                         key, bundlePath, localization.fileExists(bundlePath));
        return key;
    }
    const auto languages = localization.preferredLanguages();
    if (!key.empty() && !languages.empty() && !languages.front().empty())
        if (auto text = textInLanguage(localization, *bundle, key, languages.front()))
            return *text;
    return bundle->localizedString(key, "", table);
}

} // namespace tarn
