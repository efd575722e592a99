#include "media/FilePorter.h"

#include <cerrno>
#include <cstring>

#include "mediaprotocol/MediaError.h"

namespace tarn {

namespace {

FilePorter::Opened failed(MediaErrorCode code, std::string description, std::string reason = {}) {
    return {nullptr, mediaError(code, std::move(description), std::move(reason))};
}

} // namespace

FilePorter::Opened FilePorter::open(const std::string& path, Channel::Deadline deadline) {
    if (path.size() > OpenPath::longest)
        return failed(MediaErrorCode::cannotOpen, "The file could not be opened.",
                      std::strerror(ENAMETOOLONG));
    OpenPath request;
    request.length = static_cast<std::uint32_t>(path.size());
    std::memcpy(request.path.data(), path.data(), path.size());

    std::optional<MediaChild> porter;
    ReceivedMessage message;
    Channel::Result result = Channel::Result::gone;
    for (int tries = 0; tries < 2 && result == Channel::Result::gone; ++tries) { // its parent may have ended
        porter = porters_.take();
        if (porter && porter->channel().send(request) == Channel::Result::done)
            result = porter->channel().receiveUntil(deadline, message, 1);
    }
    if (result == Channel::Result::notNow) {
        process_.renew();
        return failed(MediaErrorCode::timedOut, "The file did not answer in time.");
    }
    const auto answer = message.as<Ported>();
    if (result != Channel::Result::done || !answer)
        return failed(MediaErrorCode::noDecoder, "The audio decoder is not there.");
    porters_.put(*std::move(porter), answer->idle == 1);
    switch (answer->refusal) {
    case Ported::Refusal::none:
        break;
    case Ported::Refusal::cannotOpen:
        return failed(MediaErrorCode::cannotOpen, "The file could not be opened.",
                      std::strerror(answer->error));
    default:
        return failed(MediaErrorCode::notRegularFile, "That is not a regular file.");
    }
    auto held = heldFile(message, *answer);
    if (!held || held->form == FileForm::parked)
        return failed(MediaErrorCode::cannotOpen, "The file could not be opened.");
    return {std::make_shared<HeldFile>(*std::move(held)), {}};
}

std::optional<HeldFile> FilePorter::heldFile(ReceivedMessage& message, const Ported& answer) {
    HeldFile held{answer.form, message.takeFile()};
    const bool known =
        held.form == FileForm::open || held.form == FileForm::parked || held.form == FileForm::path;
    if (!known || !held.descriptor)
        return std::nullopt;
    return held;
}

FilePorter::Loan FilePorter::lend(const HeldFile& file) {
    if (file.form != FileForm::path)
        return {file.form, file.descriptor.get(), {}};
    auto place = Channel::makePair();
    auto porter = porters_.take();
    if (!place || !porter)
        return {};
    const int files[] = {file.descriptor.get(), place->first.socket()};
    static_cast<void>(porter->channel().send(ReopenFile{}, files));
    porters_.put(*std::move(porter), false);
    FileDescriptor end = place->second.takeSocket();
    const int number = end.get();
    return {FileForm::parked, number, std::move(end)};
}

} // namespace tarn
