#pragma once

#include <memory>
#include <optional>
#include <string_view>

#include "proto/Message.h"
#include "proto/TransportError.h"
#include "roles/Data.h"

namespace tarn {

/// What a callback was called with: data or none, an error or none.
class TransportReply final : public Message<TransportReply> {
public:
    static constexpr std::string_view className = "TransportReply";

    const std::optional<Data>& data() const { return data_; }
    void setData(std::optional<Data> value) { data_ = std::move(value); }

    const std::shared_ptr<TransportError>& error() const { return error_; }
    void setError(std::shared_ptr<TransportError> message) { error_ = std::move(message); }
    bool hasError() const { return error_ != nullptr; }

    static constexpr auto fields() {
        return std::tuple{optional(1, "data", &Self::data_), optional(2, "error", &Self::error_)};
    }

private:
    std::optional<Data> data_;
    std::shared_ptr<TransportError> error_;
};

extern template class Message<TransportReply>;

} // namespace tarn
