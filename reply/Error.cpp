#include "reply/Error.h"

#include <array>
#include <cstddef>

#include "reply/LocalizedString.h"

namespace tarn {

namespace {

constexpr const char* unknownMessage = "VLErrorUnknownMessage";

/// What a code's text is looked up by, and what stands for it without a translation.
constexpr std::array messageKeys = {
    "VLErrorNoErrorMessage",
    unknownMessage,
    "VLErrorBadTorviAppURLMessage",
    "VLErrorAppURLMessage",
    "VLErrorApplicationIconNotFoundMessage",
    "VLErrorInvalidBundleNoTorviBinaryMessage",
    "VLErrorMissingCompanionAppIdentifierMessage",
    "VLErrorApplicationVerificationMessage",
    "VLErrorHostPrincipalForPluginNotFoundMessage",
    "VLErrorFailedToTerminateTorviAppMessage",
    "VLErrorPlistToDataErrorMessage",
    unknownMessage,
    "VLErrorTorviInstallNeverFinishedErrorMessage",
    "VLErrorTorviLaunchCanceledErrorMessage",
    "The device-to-device messaging service has no space left.",
    "The plug-in service never called back after a begin-using request.",
    "No first unlock yet.",
    "Profile install  error.",
    "Profile removal  error.",
    "VLErrorDeviceIsLockedMessage",
    "Pellion app not found.",
    "VLErrorBuildAndRunLaunchFailedCantFindApplicationMessage",
    "VLErrorInstallationErrorMessage",
    "VLErrorBuildAndRunLaunchFailedQuelletsNotSupportedMessage",
    "VLErrorAudioPlaybackErrorMessage",
    "VLErrorAudioPLaybackConnectionLostMessage",
    unknownMessage,
    "VLErrorBuildAndRunNotificationFailedNoPermissionMessage",
};
static_assert(messageKeys.size() == 28);

const char* messageKey(std::int64_t code) {
    const bool isKnown = code >= 0 && static_cast<std::uint64_t>(code) < messageKeys.size();
    return isKnown ? messageKeys[static_cast<std::size_t>(code)] : unknownMessage;
}

} // namespace

Error VLError::errorWithCode(const Localization& localization, std::int64_t code) {
    const std::string description = vlUtils_localizedStringForSystemLanguage(localization, messageKey(code),
                                                                             localization.errorBundlePath());
    return {domain, code, {{localizedDescriptionKey, description}}};
}

Error VLError::errorWithCode(const Localization& localization, std::int64_t code,
                             const std::optional<std::string>& additionalDescription) {
    Error error = errorWithCode(localization, code);
    if (additionalDescription)
        error.userInfo[localizedFailureReasonKey] = *additionalDescription;
    return error;
}

} // namespace tarn
