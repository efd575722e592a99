#include "ipc/CallAnswer.h"

#include <utility>

#include "ipc/TransportMessages.h"
#include "log/SystemLog.h"
#include "wire/BlockCache.h"
#include "wire/ProtoWriter.h"

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

void* CallAnswer::operator new(std::size_t) { return BlockCache<sizeof(CallAnswer)>::take(); }

void CallAnswer::operator delete(void* block) noexcept { BlockCache<sizeof(CallAnswer)>::give(block); }

void CallAnswer::call(std::optional<Data> data, const std::optional<Error>& error) {
    if (callId_ == 0 || answered_)
        return;
    ProtoWriter reply;
    writeReply(std::move(data), error, reply);
    if (reply.bytes().size() > FrameHeader::largestBody) {
        SystemLog::error(__func__, __LINE__, "%{public}s:%d: dropped an answer of %d bytes: too long",
                         reply.bytes().size());
        return;
    }
    answered_ = true;
    socket_->send(FrameKind::reply, callId_, reply.bytes());
}

} // namespace tarn
