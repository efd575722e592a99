#include "service/LongFormAudioCommand.h"

#include "service/AudioFilePlayerServer.h"

namespace tarn {

void VLLongFormAudioCommand::runOnAudioPlayer(VLTorviAudioFilePlayerServer& audioPlayer) const {
    audioPlayer.handleMessage(message_, completion_);
}

void VLLongFormAudioCommand::cancelWithError(const Error& error) const {
    if (completion_ != nullptr)
        completion_->error(error);
}

} // namespace tarn
