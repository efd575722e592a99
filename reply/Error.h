#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "roles/Error.h"
#include "roles/Localization.h"

namespace tarn {

/// The errors of the domain "ostrel.pellion.errors", which are all that a client is answered with. Any thread
/// may call.
class VLError {
public:
    static constexpr const char* domain = "ostrel.pellion.errors";

    /// The codes that this service raises; the domain has 28, from 0 to 27.
    static constexpr std::int64_t audioPlayback = 24;
    static constexpr std::int64_t connectionLost = 25;
    static constexpr std::int64_t unknownIdentifier = 26;

    /// Keeps the code as given, also one that is not known, and describes it in the user's language.
    static Error errorWithCode(const Localization& localization, std::int64_t code);

    /// The same with the additional description, if there is one, as the failure reason.
    static Error errorWithCode(const Localization& localization, std::int64_t code,
                               const std::optional<std::string>& additionalDescription);

    static bool isValidationErrorCode(std::int64_t code) { return code == 5; }
};

} // namespace tarn
