#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "proto/Message.h"
#include "roles/Data.h"

namespace tarn {

/// One typed value of a property list.
///
/// Field 3 is reserved for a message that this system does not define: it is skipped like an unknown field,
/// and `cacheMessage` is a local slot that no rule of the messages looks at.
class VLProtoVelmoObject final : public Message<VLProtoVelmoObject> {
public:
    static constexpr std::string_view className = "VLProtoVelmoObject";

    std::int32_t type() const { return type_; }
    void setType(std::int32_t value) { type_ = value; }

    std::int32_t subtype() const { return subtype_; }
    void setSubtype(std::int32_t value) { setFlagged(2, subtype_, value); }
    bool hasSubtype() const { return presence_[2]; }
    void setHasSubtype(bool present) { presence_.set(2, present); }

    const std::optional<std::string>& key() const { return key_; }
    void setKey(std::optional<std::string> value) { key_ = std::move(value); }
    bool hasKey() const { return key_.has_value(); }

    const std::optional<std::string>& text() const { return text_; }
    void setText(std::optional<std::string> value) { text_ = std::move(value); }
    bool hasText() const { return text_.has_value(); }

    double ndouble() const { return ndouble_; }
    void setNdouble(double value) { setFlagged(6, ndouble_, value); }
    bool hasNdouble() const { return presence_[6]; }
    void setHasNdouble(bool present) { presence_.set(6, present); }

    float nfloat() const { return nfloat_; }
    void setNfloat(float value) { setFlagged(7, nfloat_, value); }
    bool hasNfloat() const { return presence_[7]; }
    void setHasNfloat(bool present) { presence_.set(7, present); }

    std::int64_t nint64() const { return nint64_; }
    void setNint64(std::int64_t value) { setFlagged(8, nint64_, value); }
    bool hasNint64() const { return presence_[8]; }
    void setHasNint64(bool present) { presence_.set(8, present); }

    std::int32_t nint32() const { return nint32_; }
    void setNint32(std::int32_t value) { setFlagged(9, nint32_, value); }
    bool hasNint32() const { return presence_[9]; }
    void setHasNint32(bool present) { presence_.set(9, present); }

    std::uint64_t nuint64() const { return nuint64_; }
    void setNuint64(std::uint64_t value) { setFlagged(10, nuint64_, value); }
    bool hasNuint64() const { return presence_[10]; }
    void setHasNuint64(bool present) { presence_.set(10, present); }

    std::uint32_t nuint32() const { return nuint32_; }
    void setNuint32(std::uint32_t value) { setFlagged(11, nuint32_, value); }
    bool hasNuint32() const { return presence_[11]; }
    void setHasNuint32(bool present) { presence_.set(11, present); }

    bool nbool() const { return nbool_; }
    void setNbool(bool value) { setFlagged(12, nbool_, value); }
    bool hasNbool() const { return presence_[12]; }
    void setHasNbool(bool present) { presence_.set(12, present); }

    const std::optional<Data>& object() const { return object_; }
    void setObject(std::optional<Data> value) { object_ = std::move(value); }
    bool hasObject() const { return object_.has_value(); }

    const std::shared_ptr<void>& cacheMessage() const { return cacheMessage_; }
    void setCacheMessage(std::shared_ptr<void> message) { cacheMessage_ = std::move(message); }

    static constexpr auto fields() {
        return std::tuple{required(1, "type", &Self::type_),        optional(2, "subtype", &Self::subtype_),
                          optional(4, "key", &Self::key_),          optional(5, "text", &Self::text_),
                          optional(6, "ndouble", &Self::ndouble_),  optional(7, "nfloat", &Self::nfloat_),
                          optional(8, "nint64", &Self::nint64_),    optional(9, "nint32", &Self::nint32_),
                          optional(10, "nuint64", &Self::nuint64_), optional(11, "nuint32", &Self::nuint32_),
                          optional(12, "nbool", &Self::nbool_),     optional(13, "object", &Self::object_)};
    }

private:
    std::int32_t type_ = 0;
    std::int32_t subtype_ = 0;
    std::optional<std::string> key_;
    std::optional<std::string> text_;
    double ndouble_ = 0;
    float nfloat_ = 0;
    std::int64_t nint64_ = 0;
    std::int32_t nint32_ = 0;
    std::uint64_t nuint64_ = 0;
    std::uint32_t nuint32_ = 0;
    bool nbool_ = false;
    std::optional<Data> object_;
    std::shared_ptr<void> cacheMessage_;
};

extern template class Message<VLProtoVelmoObject>;

} // namespace tarn
