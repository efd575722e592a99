// Anything at all as an envelope: decoded as the oracle says, and what was decoded survives every operation.

#include <cstdlib>

#include "fuzz/Oracle.h"
#include "proto/VelmoMessage.h"

namespace tarn {

namespace {

void require(bool condition) {
    if (!condition)
        std::abort();
}

void tryEnvelope(std::span<const std::uint8_t> bytes) {
    const auto message = VLProtoVelmoMessage::fromData(bytes);
    const auto expected = expectedEncoding(bytes);
    const auto command = VLProtoVelmoMessage::fromDataWithoutPlist(bytes);
    require((message != nullptr) == expected.has_value() && (command != nullptr) == expected.has_value());
    if (!message)
        return;
    const Data encoding = message->serialize();
    require(encoding == *expected);

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
