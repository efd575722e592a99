#pragma once

#include <string>

#include "roles/Localization.h"

namespace tarn {

/// The text for `key` in the bundle's table "Localizable": in the user's first language, else by the bundle's
/// own choice, else the key itself. Logs an error when there is no bundle at the path.
std::string vlUtils_localizedStringForSystemLanguage(const Localization& localization, const std::string& key,
                                                     const std::string& bundlePath);

} // namespace tarn
