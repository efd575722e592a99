#include "media/FileExaminer.h"

#include "mediaprotocol/MediaError.h"

namespace tarn {

FileExaminer::Outcome FileExaminer::examine(const HeldFile& file, Channel::Deadline deadline) {
    auto examiner = examiners_.take();
    const FilePorter::Loan loan = porter_.lend(file);
    ReceivedMessage message;
    Channel::Result result = Channel::Result::gone;
    if (examiner && loan.form != FileForm::none &&
        examiner->channel().send(Examine{.form = loan.form}, std::span(&loan.descriptor, 1)) ==
            Channel::Result::done)
        result = examiner->channel().receiveUntil(deadline, message);
    if (!examiner || loan.form == FileForm::none)
        return {std::nullopt, mediaError(MediaErrorCode::noDecoder, "The audio decoder is not there.")};
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
    examiners_.put(*std::move(examiner), answer->idle == 1);
    if (failed)
        return {std::nullopt, answer->error.toError()};
    return {std::move(info), {}};
}

} // namespace tarn
