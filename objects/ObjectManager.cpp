#include "objects/ObjectManager.h"

#include <utility>

#include "log/SystemLog.h"
#include "reply/Error.h"

namespace tarn {

VLTorviAudioFilePlayerObjectManager::VLTorviAudioFilePlayerObjectManager(const Platform& platform,
                                                                         std::string_view className)
    : platform_(platform), className_(className) {}

std::shared_ptr<EventSink> VLTorviAudioFilePlayerObjectManager::audioServer() const {
    return audioServer_.withLocked([](const auto& audioServer) { return audioServer.lock(); });
}

void VLTorviAudioFilePlayerObjectManager::setAudioServer(std::weak_ptr<EventSink> audioServer) {
    audioServer_.withLocked([&](auto& current) { current.swap(audioServer); });
}

void VLTorviAudioFilePlayerObjectManager::_reportMissingAssetWithID(
    const std::optional<std::string>& identifier, std::string_view command, Reply& reply) const {
    SystemLog::error(methodName("_reportMissingAssetWithID:whenProcessingCommand:reply:"), __LINE__,
                     "%{public}s:%d: Could not find MediaItem with id %{public}@ when handling `%{public}@` "
                     "command. Ignoring command.",
                     identifier, command);
    reply.error(VLError::errorWithCode(platform_.localization, VLError::unknownIdentifier));
}

bool VLTorviAudioFilePlayerObjectManager::requireIdentifier(const std::optional<std::string>& identifier,
                                                            std::string_view command) const {
    if (!identifier)
        SystemLog::error(methodName("handleMessage:reply:"), __LINE__,
                         "%{public}s:%d: `%{public}@` command came without an identifier. Ignoring command.",
                         command);
    return identifier.has_value();
}

bool VLTorviAudioFilePlayerObjectManager::requireIdentifier(const std::optional<std::string>& identifier,
                                                            std::string_view command, Reply& reply) const {
    bool given = requireIdentifier(identifier, command);
    if (!given)
        reply.error(VLError::errorWithCode(platform_.localization, VLError::unknownIdentifier));
    return given;
}

std::optional<ObjectAccount::Charge>
VLTorviAudioFilePlayerObjectManager::charge(std::size_t bytes, std::string_view command, Reply& reply) const {
    auto charge = account_->charge(bytes);
    if (!charge) {
        SystemLog::error(methodName("handleMessage:reply:"), __LINE__,
                         "%{public}s:%d: `%{public}@` command refused: the client has made too many objects.",
                         command);
        reply.error(VLError::errorWithCode(platform_.localization, VLError::audioPlayback,
                                           "The program has made too many objects."));
    }
    return charge;
}

std::string VLTorviAudioFilePlayerObjectManager::methodName(std::string_view selector) const {
    return std::string("-[").append(className_).append(" ").append(selector).append("]");
}

} // namespace tarn
