#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "objects/ObjectAccount.h"
#include "reply/EventSink.h"
#include "roles/Platform.h"
#include "roles/Reply.h"
#include "threads/LiveObjects.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// Base of the managers of assets, player items and queue players: the weak link to the service, and what is
/// said about commands that name nothing.
///
/// Commands run one at a time on the queue that the router gives them to; the links may be read and set from
/// any thread.
class VLTorviAudioFilePlayerObjectManager {
public:
    VLTorviAudioFilePlayerObjectManager(const VLTorviAudioFilePlayerObjectManager&) = delete;
    VLTorviAudioFilePlayerObjectManager& operator=(const VLTorviAudioFilePlayerObjectManager&) = delete;

    /// Null before it is set, and once the service is gone.
    std::shared_ptr<EventSink> audioServer() const;
    void setAudioServer(std::weak_ptr<EventSink> audioServer);

    /// Before the first command. Without it nothing is counted together with the objects of other managers.
    void setAccount(std::shared_ptr<ObjectAccount> account) { account_ = std::move(account); }

protected:
    /// `className` names the manager in the log; it is a literal.
    VLTorviAudioFilePlayerObjectManager(const Platform& platform, std::string_view className);
    ~VLTorviAudioFilePlayerObjectManager() = default;

    const Platform& platform() const { return platform_; }

    /// Logs that `command` names an object that is not there, and answers with error 26.
    void _reportMissingAssetWithID(const std::optional<std::string>& identifier, std::string_view command,
                                   Reply& reply) const;

    /// False, with one log line, when `command` came without the identifier that it needs.
    [[nodiscard]] bool requireIdentifier(const std::optional<std::string>& identifier,
                                         std::string_view command) const;

    /// Also answers with error 26 when the identifier is missing.
    [[nodiscard]] bool requireIdentifier(const std::optional<std::string>& identifier,
                                         std::string_view command, Reply& reply) const;

    /// The charge for an object that takes so much. None, with one log line and error 24 as the answer, when
    /// the client has made too many.
    std::optional<ObjectAccount::Charge> charge(std::size_t bytes, std::string_view command,
                                                Reply& reply) const;

private:
    std::string methodName(std::string_view selector) const;

    const Platform platform_;
    const std::string_view className_;
    MutexProtected<std::weak_ptr<EventSink>> audioServer_;
    std::shared_ptr<ObjectAccount> account_ = std::make_shared<ObjectAccount>();
    LiveObject<"object manager"> live_;
};

} // namespace tarn
