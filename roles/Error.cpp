#include "roles/Error.h"

namespace tarn {

std::string textsOf(const Error& error) {
    std::string text;
    for (const char* key : {localizedDescriptionKey, localizedFailureReasonKey}) {
        auto entry = error.userInfo.find(key);
        if (entry == error.userInfo.end())
            continue;
        if (!text.empty())
            text += ' ';
        text += entry->second;
    }
    return text;
}

std::string describe(const Error& error) {
    const std::string text = textsOf(error);
    return text + (text.empty() ? "(" : " (") + error.domain + ", code " + std::to_string(error.code) + ')';
}

std::string describe(const std::optional<Error>& error) {
    return error ? describe(*error) : "no error given";
}

} // namespace tarn
