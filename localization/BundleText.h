#pragma once

#include <string>

#include "roles/Localization.h"

namespace tarn {

/// What Bundle::localizedString() promises, for every kind of bundle. Its own choice of language is the
/// user's, in order of preference; English where that has no text.
std::string textOfBundle(const Bundle& bundle, const Localization& localization, const std::string& key,
                         const std::string& defaultValue, const std::string& table);

} // namespace tarn
