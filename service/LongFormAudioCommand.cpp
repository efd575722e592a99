#include "service/LongFormAudioCommand.h"

#include "service/AudioFilePlayerServer.h"

namespace tarn {

void VLLongFormAudioCommand::runOnAudioPlayer(VLTorviAudioFilePlayerServer& audioPlayer) const {
    audioPlayer.handleMessage(message_, completion_);
}

} // namespace tarn
