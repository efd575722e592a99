#pragma once

#include <map>
#include <optional>
#include <string>

#include "roles/Data.h"
#include "roles/Error.h"

namespace tarn {

/// A serialized property list, or why there is none.
struct PropertyListOutcome {
    std::optional<Data> data;
    Error error; // meaningful when there is no data
};

/// The binary form (version 1.0) of a dictionary of texts. Texts that are not UTF-8 are the one error.
PropertyListOutcome binaryPropertyList(const std::map<std::string, std::string>& dictionary);

} // namespace tarn
