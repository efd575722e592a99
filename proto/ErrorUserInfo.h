#pragma once

#include <map>
#include <optional>
#include <string>

#include "roles/Data.h"

namespace tarn {

/// The texts of an error that a client is shown, as a binary property list: its localized description and its
/// localized failure reason under their own keys, nothing else. None when there is neither; also when they
/// cannot be serialized, which is logged.
std::optional<Data> VLMakeDataFromErrorUserInfo(const std::map<std::string, std::string>& userInfo);

} // namespace tarn
