#pragma once

#include <memory>
#include <utility>

#include "reply/Reply.h"
#include "roles/Error.h"

namespace tarn {

class VLProtoAudioFilePlayerMessage;
class VLTorviAudioFilePlayerServer;

/// One message of the client on its way to the router, with the reply that answers it. Made on the main
/// queue, run once on the command queue.
class VLLongFormAudioCommand {
public:
    /// Both may be null.
    VLLongFormAudioCommand(std::shared_ptr<VLProtoAudioFilePlayerMessage> message,
                           std::shared_ptr<Reply> completion)
        : message_(std::move(message)), completion_(std::move(completion)) {}

    const std::shared_ptr<VLProtoAudioFilePlayerMessage>& message() const { return message_; }
    void setMessage(std::shared_ptr<VLProtoAudioFilePlayerMessage> message) { message_ = std::move(message); }

    /// Shared with the work that the router submits.
    const std::shared_ptr<Reply>& completion() const { return completion_; }
    void setCompletion(std::shared_ptr<Reply> completion) { completion_ = std::move(completion); }

    void runOnAudioPlayer(VLTorviAudioFilePlayerServer& audioPlayer) const;

    /// Answers with the error, unless there is no completion.
    void cancelWithError(const Error& error) const;

private:
    std::shared_ptr<VLProtoAudioFilePlayerMessage> message_;
    std::shared_ptr<Reply> completion_;
};

} // namespace tarn
