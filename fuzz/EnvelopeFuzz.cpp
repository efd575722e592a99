// Anything at all as an envelope: what can be decoded at all encodes to the same bytes from then on, and
// survives every operation. What it is decoded to is compared with another implementation in tests/proto.

#include <cstdlib>

#include "proto/VelmoMessage.h"

namespace tarn {

namespace {

void require(bool condition) {
    if (!condition)
        std::abort();
}

void tryEnvelope(std::span<const std::uint8_t> bytes) {
    const auto message = VLProtoVelmoMessage::fromData(bytes);
    const auto command = VLProtoVelmoMessage::fromDataWithoutPlist(bytes);
    require((message != nullptr) == (command != nullptr));
    if (!message)
        return;
    const Data encoding = message->serialize();
    const auto again = VLProtoVelmoMessage::fromData(encoding);
    require(again && again->serialize() == encoding);

    const auto copy = message->copyWithZone();
    require(copy->serialize() == encoding && copy->hash() == message->hash());
    copy->setPlist(nullptr);
    require(copy->serialize() == command->serialize());
    VLProtoVelmoMessage merged;
    merged.mergeFrom(*message);
    require(merged.isEqual(*message) == message->isEqual(*message)); // not-a-number differs from itself
    require(!message->description().empty());
}

} // namespace

} // namespace tarn

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    tarn::tryEnvelope({data, size});
    return 0;
}
