#include "localization/LanguageChoice.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <optional>
#include <string_view>

namespace tarn {

namespace {

bool isAlphabetic(std::string_view part) {
    return std::ranges::all_of(part, [](unsigned char letter) { return std::isalpha(letter) != 0; });
}

std::string lowered(std::string_view part) {
    std::string result(part);
    std::ranges::transform(result, result.begin(),
                           [](unsigned char letter) { return static_cast<char>(std::tolower(letter)); });
    return result;
}

/// What of a language's name decides, in lower case.
struct Language {
    std::string language;
    std::string script;
    std::string region;
};

/// The script that a language is written in when its name does not say.
std::string_view usualScript(const Language& name) {
    if (name.language == "zh")
        return name.region == "tw" || name.region == "hk" || name.region == "mo" ? "hant" : "hans";
    if (name.language == "sr")
        return "cyrl";
    return "";
}

Language parseLanguage(std::string_view name) {
    Language result;
    for (bool isFirst = true; !name.empty(); isFirst = false) {
        const std::size_t end = std::min(name.find_first_of("-_"), name.size());
        const std::string_view part = name.substr(0, end);
        name.remove_prefix(std::min(end + 1, name.size()));
        if (isFirst)
            result.language = lowered(part);
        else if (part.size() == 4 && isAlphabetic(part))
            result.script = lowered(part);
        else if (part.size() == 2 || part.size() == 3)
            result.region = lowered(part);
    }
    if (result.script.empty())
        result.script = usualScript(result);
    return result;
}

/// Smaller is better; none when it does not suit at all.
std::optional<int> distance(const Language& localization, const Language& preference) {
    if (localization.language != preference.language || localization.script != preference.script)
        return std::nullopt;
    if (localization.region == preference.region)
        return 0;
    return localization.region.empty() ? 1 : 2;
}

/// "de_AT.UTF-8@euro" as "de-AT"; a modifier counts when it names a script. Empty for the locale of no
/// language.
std::string languageOfLocale(std::string_view locale) {
    const std::string_view name = locale.substr(0, locale.find_first_of(".@"));
    if (name == "C" || name == "POSIX")
        return {};
    std::string language(name);
    std::ranges::replace(language, '_', '-');
    constexpr std::array<std::pair<std::string_view, std::string_view>, 2> scripts{
        {{"@latin", "-Latn"}, {"@cyrillic", "-Cyrl"}}};
    for (const auto& [modifier, script] : scripts)
        if (locale.ends_with(modifier))
            language.insert(std::min(language.find('-'), language.size()), script);
    return language;
}

} // namespace

std::vector<std::string> choosePreferredLocalizations(const std::vector<std::string>& localizations,
                                                      const std::vector<std::string>& preferences) {
    std::vector<std::string> chosen;
    for (const std::string& preference : preferences) {
        std::vector<std::pair<int, std::string>> suitable;
        for (const std::string& localization : localizations)
            if (const auto far = distance(parseLanguage(localization), parseLanguage(preference)))
                suitable.emplace_back(*far, localization);
        std::ranges::sort(suitable);
        for (auto& [far, localization] : suitable)
            if (std::ranges::find(chosen, localization) == chosen.end())
                chosen.push_back(std::move(localization));
    }
    return chosen;
}

std::vector<std::string> languagesFromEnvironment(const EnvironmentLookup& environment) {
    std::string locale;
    for (const char* name : {"LC_ALL", "LC_MESSAGES", "LANG"})
        if (locale.empty())
            locale = environment(name);
    if (locale.empty() || locale == "C" || locale == "POSIX")
        return {};
    std::string list = environment("LANGUAGE");
    if (list.empty())
        list = locale;
    std::vector<std::string> languages;
    for (std::string_view rest = list; !rest.empty();) {
        const std::size_t end = std::min(rest.find(':'), rest.size());
        const std::string_view entry = rest.substr(0, end);
        rest.remove_prefix(std::min(end + 1, rest.size()));
        if (entry.empty())
            continue;
        std::string language = languageOfLocale(entry);
        if (language.empty())
            break;
        if (std::ranges::find(languages, language) == languages.end())
            languages.push_back(std::move(language));
    }
    return languages;
}

} // namespace tarn
