#include "tarn/Answer.h"

#include "roles/Error.h"

namespace tarn::client {

namespace {

std::string textOf(const Error& error, const char* key) {
    const auto found = error.texts.find(key);
    return found == error.texts.end() ? std::string() : found->second;
}

} // namespace

std::string Error::description() const { return textOf(*this, localizedDescriptionKey); }

std::string Error::failureReason() const { return textOf(*this, localizedFailureReasonKey); }

std::string Error::summary() const {
    std::string line = description();
    if (line.find(' ') == std::string::npos) // a service without its texts sends the key of one instead
        line.clear();
    if (const auto reason = failureReason(); !reason.empty())
        line += line.empty() ? reason : " (" + reason + ")";
    if (line.empty())
        line = domain + " " + std::to_string(code);
    return line;
}

std::string Completion::problem() const {
    switch (outcome) {
    case Outcome::answered:
    case Outcome::released:
        return {};
    case Outcome::failed:
        return error.summary();
    case Outcome::connectionLost:
        return "the connection to the service was lost";
    case Outcome::takenOver:
        return "another program has taken over the service";
    }
    return {};
}

} // namespace tarn::client
