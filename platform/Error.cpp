#include "platform/Error.h"

namespace tarn {

std::string describe(const Error& error) {
    std::string text;
    for (const char* key : {localizedDescriptionKey, localizedFailureReasonKey}) {
        auto entry = error.userInfo.find(key);
        if (entry != error.userInfo.end())
            text += entry->second + ' ';
    }
    return text + '(' + error.domain + ", code " + std::to_string(error.code) + ')';
}

std::string describe(const std::optional<Error>& error) {
    return error ? describe(*error) : "no error given";
}

} // namespace tarn
