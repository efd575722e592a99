#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"

namespace tarn {

/// Announces the open file that comes with it: `token` is good for opening `path`.
class TransportExtension final : public Message<TransportExtension> {
public:
    static constexpr std::string_view className = "TransportExtension";

    const std::optional<std::string>& token() const { return token_; }
    void setToken(std::optional<std::string> value) { token_ = std::move(value); }

    const std::optional<std::string>& path() const { return path_; }
    void setPath(std::optional<std::string> value) { path_ = std::move(value); }

    static constexpr auto fields() {
        return std::tuple{required(1, "token", &Self::token_), required(2, "path", &Self::path_)};
    }

private:
    std::optional<std::string> token_;
    std::optional<std::string> path_;
};

extern template class Message<TransportExtension>;

} // namespace tarn
