#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>

namespace tarn {

/// The error value that travels to a client: which domain, which code, and texts for a person.
struct Error {
    std::string domain;
    std::int64_t code = 0;
    std::map<std::string, std::string> userInfo;

    bool operator==(const Error&) const = default;
};

/// Keys of Error::userInfo, also used inside `errorDict` and on the transport.
inline constexpr char localizedDescriptionKey[] = "LocalizedDescription";
inline constexpr char localizedFailureReasonKey[] = "LocalizedFailureReason";

/// What it tells a person: the description, and the reason behind it; empty when it has neither.
std::string textsOf(const Error& error);

/// For the log: the texts if there are any, with domain and code.
std::string describe(const Error& error);

/// As above; "no error given" when there is none.
std::string describe(const std::optional<Error>& error);

} // namespace tarn
