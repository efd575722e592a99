#include "proto/ErrorUserInfo.h"

#include "log/SystemLog.h"
#include "roles/Error.h"
#include "wire/PropertyList.h"

namespace tarn {

std::optional<Data> VLMakeDataFromErrorUserInfo(const std::map<std::string, std::string>& userInfo) {
    std::map<std::string, std::string> texts;
    for (const char* key : {localizedDescriptionKey, localizedFailureReasonKey}) {
        if (const auto entry = userInfo.find(key); entry != userInfo.end())
            texts.insert(*entry);
    }
    if (texts.empty())
        return std::nullopt;

    auto outcome = binaryPropertyList(texts);
    if (!outcome.data) {
        SystemLog::error("_VLMakeDataFromErrorUserInfo", 61,
                         "%{public}s:%d: Error serializing audio file player item status error: %{public}@",
                         describe(outcome.error));
    }
    return std::move(outcome.data);
}

} // namespace tarn
