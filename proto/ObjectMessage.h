#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"

namespace tarn {

/// A command or event that needs nothing but the name of the object that it is about.
class VLProtoObjectMessage final : public Message<VLProtoObjectMessage> {
public:
    static constexpr std::string_view className = "VLProtoObjectMessage";

    const std::optional<std::string>& identifier() const { return identifier_; }
    void setIdentifier(std::optional<std::string> value) { identifier_ = std::move(value); }

    static constexpr auto fields() { return std::tuple{required(1, "identifier", &Self::identifier_)}; }

private:
    std::optional<std::string> identifier_;
};

extern template class Message<VLProtoObjectMessage>;

} // namespace tarn
