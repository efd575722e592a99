#pragma once

#include <optional>

#include "media/FilePorter.h"
#include "mediaprotocol/AudioFileInfo.h"

namespace tarn {

/// Asks processes that are locked down what files say of themselves; what they answer is checked. Any thread
/// may call.
class FileExaminer {
public:
    /// Both outlive the examiner.
    FileExaminer(MediaProcess& process, FilePorter& porter)
        : process_(process), porter_(porter), examiners_(process, ChildKind::examiner) {}

    struct Outcome {
        std::optional<AudioFileInfo> info;
        Error error; ///< meaningful when there is no info
    };

    /// Waits until the deadline at most.
    Outcome examine(const HeldFile& file, Channel::Deadline deadline);

    /// Lets all processes go that are not in use.
    void clear() { examiners_.clear(); }

private:
    Outcome outcomeOf(MediaChild examiner, Channel::Result result, const ReceivedMessage& message);

    MediaProcess& process_;
    FilePorter& porter_;
    ChildPool examiners_;
};

} // namespace tarn
