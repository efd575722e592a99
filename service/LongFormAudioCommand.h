#pragma once

#include <memory>
#include <utility>

#include "roles/Error.h"
#include "roles/Reply.h"

namespace tarn {

class VLProtoAudioFilePlayerMessage;
class VLTorviAudioFilePlayerServer;

/// One message of the client on its way to the router, with the reply that answers it. It is made on the main
/// queue and runs once, on the command queue.
class VLLongFormAudioCommand {
public:
    /// `message` may be null, and `completion` empty.
    VLLongFormAudioCommand(std::shared_ptr<VLProtoAudioFilePlayerMessage> message, Reply completion)
        : message_(std::move(message)), completion_(std::move(completion)) {}

    const std::shared_ptr<VLProtoAudioFilePlayerMessage>& message() const { return message_; }
    void setMessage(std::shared_ptr<VLProtoAudioFilePlayerMessage> message) { message_ = std::move(message); }

    const Reply& completion() const { return completion_; }
    void setCompletion(Reply completion) { completion_ = std::move(completion); }

    /// The command keeps its own copy of the reply, for the case that this fails.
    void runOnAudioPlayer(VLTorviAudioFilePlayerServer& audioPlayer) const;

    void cancelWithError(const Error& error) { completion_.error(error); }

private:
    std::shared_ptr<VLProtoAudioFilePlayerMessage> message_;
    Reply completion_;
};

} // namespace tarn
