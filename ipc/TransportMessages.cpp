#include "ipc/TransportMessages.h"

#include <memory>
#include <utility>

#include "proto/TransportExtension.h"
#include "proto/TransportReply.h"

namespace tarn {

Data encodeExtension(const Extension& extension) {
    TransportExtension message;
    message.setToken(extension.token);
    message.setPath(extension.path);
    return message.serialize();
}

std::optional<Extension> decodeExtension(std::span<const std::uint8_t> body) {
    const auto message = TransportExtension::fromData(body);
    if (!message || !message->token() || !message->path())
        return std::nullopt;
    return Extension{*message->token(), *message->path()};
}

void writeReply(std::optional<Data> data, const std::optional<Error>& error, ProtoWriter& writer) {
    TransportReply message;
    message.setData(std::move(data));
    if (error) {
        auto part = std::make_shared<TransportError>();
        part->setDomain(error->domain);
        part->setCode(error->code);
        for (const auto& [key, value] : error->userInfo) {
            auto entry = std::make_shared<TransportEntry>();
            entry->setKey(key);
            entry->setValue(value);
            part->addUserInfo(std::move(entry));
        }
        message.setError(std::move(part));
    }
    message.writeTo(writer);
}

std::optional<CallReply> decodeReply(std::span<const std::uint8_t> body) {
    const auto message = TransportReply::fromData(body);
    if (!message)
        return std::nullopt;
    CallReply reply{message->data(), std::nullopt};
    if (const auto& part = message->error()) {
        reply.error = {.domain = part->domain().value_or(""), .code = part->code(), .userInfo = {}};
        for (std::size_t i = 0; i < part->userInfoCount(); ++i) {
            const auto& entry = part->userInfoAtIndex(i);
            reply.error->userInfo[entry->key().value_or("")] = entry->value().value_or("");
        }
    }
    return reply;
}

} // namespace tarn
