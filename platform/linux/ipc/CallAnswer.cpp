#include "platform/linux/ipc/CallAnswer.h"

#include <utility>

#include "platform/SystemLog.h"
#include "platform/linux/ipc/TransportMessages.h"

namespace tarn {

CallAnswer::CallAnswer(std::shared_ptr<ConnectionSocket> socket, std::uint64_t callId, std::size_t bytes)
    : socket_(std::move(socket)), callId_(callId), bytes_(bytes) {
    socket_->beginCall(bytes_);
}

CallAnswer::~CallAnswer() {
    if (callId_ != 0 && !answered_)
        socket_->send(FrameKind::released, callId_, {});
    socket_->finishCall(bytes_);
}

void CallAnswer::call(const std::optional<Data>& data, const std::optional<Error>& error) {
    if (callId_ == 0 || answered_)
        return;
    const auto reply = encodeReply(data, error);
    if (reply.size() > FrameHeader::largestBody) {
        SystemLog::error(__func__, __LINE__, "%{public}s:%d: dropped an answer of %d bytes: too long",
                         reply.size());
        return;
    }
    answered_ = true;
    socket_->send(FrameKind::reply, callId_, reply);
}

} // namespace tarn
