#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "proto/Message.h"
#include "proto/TransportEntry.h"

namespace tarn {

/// An error as it travels in a reply.
class TransportError final : public Message<TransportError> {
public:
    static constexpr std::string_view className = "TransportError";

    const std::optional<std::string>& domain() const { return domain_; }
    void setDomain(std::optional<std::string> value) { domain_ = std::move(value); }

    std::int64_t code() const { return code_; }
    void setCode(std::int64_t value) { code_ = value; }

    using userInfoType = TransportEntry;
    const std::optional<std::vector<std::shared_ptr<TransportEntry>>>& userInfo() const { return userInfo_; }
    void addUserInfo(std::shared_ptr<TransportEntry> element) {
        listCreateIfNeeded(userInfo_).push_back(std::move(element));
    }
    std::size_t userInfoCount() const { return userInfo_ ? userInfo_->size() : 0; }
    const std::shared_ptr<TransportEntry>& userInfoAtIndex(std::size_t index) const {
        return elementAt(userInfo_, index);
    }

    static constexpr auto fields() {
        return std::tuple{required(1, "domain", &Self::domain_), required(2, "code", &Self::code_),
                          repeated(3, "userInfo", &Self::userInfo_)};
    }

private:
    std::optional<std::string> domain_;
    std::int64_t code_ = 0;
    std::optional<std::vector<std::shared_ptr<TransportEntry>>> userInfo_;
};

extern template class Message<TransportError>;

} // namespace tarn
