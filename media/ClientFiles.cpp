#include "media/ClientFiles.h"

#include <fcntl.h>
#include <sys/socket.h>

#include <utility>

namespace tarn {

namespace {

using namespace std::chrono_literals;

constexpr auto longestArrival = 10s;

std::string_view textOf(Ported::Refusal refusal) {
    switch (refusal) {
    case Ported::Refusal::notRegular:
        return "it is not a regular file";
    case Ported::Refusal::notReadable:
        return "it is not open for reading";
    case Ported::Refusal::notOneFile:
        return "it came with others";
    default:
        return "it could not be taken";
    }
}

} // namespace

class ClientFiles::PortedArrival final : public Arrival {
public:
    /// Another descriptor of the porter's socket is what the alarm ends: it may ring while take() runs.
    PortedArrival(FilePorter& porter, EventLoop& loop, MediaChild child)
        : porter_(porter),
          child_(std::move(child)),
          alarm_(loop.at(loop.now() + longestArrival,
                         [socket = std::make_shared<const FileDescriptor>(
                              ::fcntl(child_.channel().socket(), F_DUPFD_CLOEXEC, 0))] {
                             ::shutdown(socket->get(), SHUT_RDWR);
                         })) {}

    /// One that has answered is good for the next.
    ~PortedArrival() override {
        alarm_.reset();
        if (idle_)
            porter_.porters().put(std::move(child_), *idle_);
    }
    PortedArrival(const PortedArrival&) = delete;
    PortedArrival& operator=(const PortedArrival&) = delete;

    int descriptor() const override { return child_.channel().socket(); }

    std::optional<Outcome> take() override {
        ReceivedMessage message;
        const Channel::Result result = child_.channel().receiveNow(message, 1);
        if (result == Channel::Result::notNow)
            return std::nullopt;
        alarm_.reset();
        const auto answer = message.as<Ported>();
        if (result != Channel::Result::done || !answer)
            return Outcome();
        idle_ = answer->idle == 1;
        if (answer->refusal == Ported::Refusal::noFile)
            return Outcome{.isTaken = true, .files = {}};
        std::vector<ReceivedFile> files(answer->refusal == Ported::Refusal::notOneFile ? 2 : 1);
        auto held = FilePorter::heldFile(message, *answer);
        if (answer->refusal == Ported::Refusal::none && held && held->form != FileForm::path)
            files[0].file = *std::move(held);
        else
            for (ReceivedFile& file : files)
                file.refusal = textOf(answer->refusal);
        return Outcome{.isTaken = true, .files = std::move(files)};
    }

private:
    FilePorter& porter_;
    MediaChild child_;
    std::optional<bool> idle_; // once it has answered
    RegistrationHandle alarm_;
};

std::unique_ptr<FileReceiver::Arrival> ClientFiles::receive(int socket, std::size_t bytes) {
    auto porter = porter_.porters().take();
    const ReceiveFile request{.bytes = static_cast<std::uint32_t>(bytes)};
    if (!porter || porter->channel().send(request, std::span(&socket, 1)) != Channel::Result::done)
        return nullptr;
    return std::make_unique<PortedArrival>(porter_, loop_, *std::move(porter));
}

void ClientFiles::drop(int socket) {
    ::shutdown(socket, SHUT_RDWR); // whoever has it open then, the client sees its end now
    auto porter = porter_.porters().take();
    if (!porter || porter->channel().send(DropFile{}, std::span(&socket, 1)) != Channel::Result::done)
        return;
    porter_.porters().put(*std::move(porter), false);
}

} // namespace tarn
