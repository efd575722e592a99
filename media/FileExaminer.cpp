#include "media/FileExaminer.h"

#include "mediaprotocol/MediaError.h"

namespace tarn {

FileExaminer::Outcome FileExaminer::examine(const HeldFile& file, Channel::Deadline deadline) {
    for (int triesLeft = 2;;) {
        auto examiner = examiners_.take();
        const FilePorter::Loan loan = porter_.lend(file);
        if (!examiner || loan.form == FileForm::none)
            return {std::nullopt, mediaError(MediaErrorCode::noDecoder, "The audio decoder is not there.")};
        ReceivedMessage message;
        Channel::Result result =
            examiner->channel().send(Examine{.form = loan.form}, std::span(&loan.descriptor, 1));
        if (result == Channel::Result::done)
            result = examiner->channel().receiveUntil(deadline, message);
        const bool isLost = result == Channel::Result::gone && examiner->endedWithItsParent();
        if (!isLost || --triesLeft == 0)
            return outcomeOf(*std::move(examiner), result, message);
    }
}

FileExaminer::Outcome FileExaminer::outcomeOf(MediaChild examiner, Channel::Result result,
                                              const ReceivedMessage& message) {
    if (result == Channel::Result::notNow) {
        process_.renew();
        return {std::nullopt, mediaError(MediaErrorCode::timedOut, "The file did not answer in time.")};
    }
    const auto answer = message.as<Examined>();
    auto info = answer ? answer->info.checked() : std::nullopt;
    const bool failed = answer && answer->error.code != 0;
    if (result != Channel::Result::done || !answer || (!failed && (!info || !answer->tags.copyTo(*info))))
        return {std::nullopt, mediaError(MediaErrorCode::damaged, "The file broke its decoder.")};
    process_.noteLocks(answer->locks);
    examiners_.put(std::move(examiner), answer->idle == 1);
    if (failed)
        return {std::nullopt, answer->error.toError()};
    return {std::move(info), {}};
}

} // namespace tarn
