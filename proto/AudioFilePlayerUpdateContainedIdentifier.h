#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"

namespace tarn {

/// A player item and its asset, or a queue player and one of its player items.
class VLProtoAudioFilePlayerUpdateContainedIdentifier final
    : public Message<VLProtoAudioFilePlayerUpdateContainedIdentifier> {
public:
    static constexpr std::string_view className = "VLProtoAudioFilePlayerUpdateContainedIdentifier";

    const std::optional<std::string>& identifier() const { return identifier_; }
    void setIdentifier(std::optional<std::string> value) { identifier_ = std::move(value); }

    const std::optional<std::string>& containedIdentifier() const { return containedIdentifier_; }
    void setContainedIdentifier(std::optional<std::string> value) { containedIdentifier_ = std::move(value); }
    bool hasContainedIdentifier() const { return containedIdentifier_.has_value(); }

    static constexpr auto fields() {
        return std::tuple{required(1, "identifier", &Self::identifier_),
                          optional(2, "containedIdentifier", &Self::containedIdentifier_)};
    }

private:
    std::optional<std::string> identifier_;
    std::optional<std::string> containedIdentifier_;
};

extern template class Message<VLProtoAudioFilePlayerUpdateContainedIdentifier>;

} // namespace tarn
