#pragma once

#include <functional>
#include <string>
#include <vector>

namespace tarn {

/// Those of `localizations` that suit `preferences`, best first: all that suit the first preference, then
/// those that suit the second, and so on.
///
/// One suits when its language is the preferred one in the same script (zh_CN takes zh-Hans, never zh-Hant);
/// among these the same region goes first, then no region, then another one. Names are compared without
/// regard to case and to '-' or '_'.
std::vector<std::string> choosePreferredLocalizations(const std::vector<std::string>& localizations,
                                                      const std::vector<std::string>& preferences);

/// The value of an environment variable; empty when it is not set.
using EnvironmentLookup = std::function<std::string(const char* name)>;

/// The user's languages as programs with gettext read them, as "pt-BR", most preferred first: those of
/// LANGUAGE, up to a "C" in it, or else the one of the first that is set of LC_ALL, LC_MESSAGES and LANG.
/// Empty in the "C" locale, in which LANGUAGE does not count.
std::vector<std::string> languagesFromEnvironment(const EnvironmentLookup& environment);

} // namespace tarn
