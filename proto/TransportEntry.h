#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"

namespace tarn {

/// One text of an error's user information.
class TransportEntry final : public Message<TransportEntry> {
public:
    static constexpr std::string_view className = "TransportEntry";

    const std::optional<std::string>& key() const { return key_; }
    void setKey(std::optional<std::string> value) { key_ = std::move(value); }

    const std::optional<std::string>& value() const { return value_; }
    void setValue(std::optional<std::string> value) { value_ = std::move(value); }

    static constexpr auto fields() {
        return std::tuple{required(1, "key", &Self::key_), required(2, "value", &Self::value_)};
    }

private:
    std::optional<std::string> key_;
    std::optional<std::string> value_;
};

extern template class Message<TransportEntry>;

} // namespace tarn
