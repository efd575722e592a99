#pragma once

#include <string>
#include <vector>

#include "roles/Data.h"

namespace tarn {

/// Bytes that cost more to decode than anything a client has reason to send.
struct WorstInput {
    std::string what;
    Data bytes;
};

/// As long as one frame may be, each.
std::vector<WorstInput> worstInputs();

} // namespace tarn
