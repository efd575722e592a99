#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace tarn::client {

using Bytes = std::vector<std::uint8_t>;

/// What went wrong, as the service tells it.
struct Error {
    std::string domain; ///< whose codes these are, such as "ostrel.pellion.errors"
    std::int64_t code = 0;
    std::map<std::string, std::string> texts; ///< for a person, in the user's language

    /// What went wrong; empty when the service did not say.
    std::string description() const;
    /// Why; empty when the service did not say.
    std::string failureReason() const;
    /// One line of all of it, never empty.
    std::string summary() const;
};

/// How a call ended. Every call ends in exactly one of these ways, once.
enum class Outcome {
    answered,       ///< with an answer
    failed,         ///< with an error
    released,       ///< the service is done with it and gives no answer, as most commands do that succeed
    connectionLost, ///< the connection ended first: whether the command was carried out is not known
    takenOver,      ///< not carried out: another program has taken over the service before
};

/// The answer to a call, as it came.
struct Answer {
    Outcome outcome = Outcome::connectionLost;
    std::optional<Bytes> data{}; ///< when answered, and even then maybe absent
    Error error{};               ///< when failed
};

/// How a command ended that has no answer of its own.
struct Completion {
    Outcome outcome = Outcome::connectionLost;
    Error error; ///< when failed

    /// Answered or released.
    bool succeeded() const { return outcome == Outcome::answered || outcome == Outcome::released; }
    /// Why it did not succeed, in one line.
    std::string problem() const;
};

/// How a command ended, with its answer.
template <class Value>
struct Result : Completion {
    Value value{}; ///< as the service gave it when the outcome is `answered`
};

} // namespace tarn::client
