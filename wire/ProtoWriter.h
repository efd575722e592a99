#pragma once

#include <array>
#include <cstdint>
#include <cstring>
#include <memory>
#include <span>
#include <string_view>

#include "roles/Data.h"
#include "wire/ProtoReader.h"

namespace tarn {

class ProtoCodable;

/// Collects the Protocol Buffers encoding of the fields that it is given, in the order in which they come.
///
/// Small messages are collected without an allocation. One thread at a time.
class ProtoWriter {
public:
    ProtoWriter() = default;
    ProtoWriter(const ProtoWriter&) = delete;
    ProtoWriter& operator=(const ProtoWriter&) = delete;

    void writeString(std::string_view value, std::uint32_t fieldNumber) {
        writeLengthDelimited(value.data(), value.size(), fieldNumber);
    }
    void writeData(std::span<const std::uint8_t> value, std::uint32_t fieldNumber) {
        writeLengthDelimited(value.data(), value.size(), fieldNumber);
    }
    void writeDouble(double value, std::uint32_t fieldNumber) {
        writeFixed(value, WireType::fixed64, fieldNumber);
    }
    void writeFloat(float value, std::uint32_t fieldNumber) {
        writeFixed(value, WireType::fixed32, fieldNumber);
    }
    void writeInt32(std::int32_t value, std::uint32_t fieldNumber) { writeInt64(value, fieldNumber); }
    void writeInt64(std::int64_t value, std::uint32_t fieldNumber) {
        writeUint64(static_cast<std::uint64_t>(value), fieldNumber);
    }
    void writeUint32(std::uint32_t value, std::uint32_t fieldNumber) { writeUint64(value, fieldNumber); }
    void writeUint64(std::uint64_t value, std::uint32_t fieldNumber);
    void writeBool(bool value, std::uint32_t fieldNumber) { writeUint64(value ? 1 : 0, fieldNumber); }

    /// Length-delimited, with the message's own encoding.
    void writeMessage(const ProtoCodable& message, std::uint32_t fieldNumber);

    /// Everything that was written so far.
    Data data() const { return {begin_, cursor_}; }

    /// The same without a copy; good until more is written.
    std::span<const std::uint8_t> bytes() const { return {begin_, cursor_}; }

private:
    static constexpr std::size_t longestVarint = 10;
    static constexpr std::size_t longestKeyAndNumber = 2 * longestVarint;

    /// Makes room for `count` more bytes.
    void ensure(std::size_t count) {
        if (static_cast<std::size_t>(end_ - cursor_) < count)
            grow(count);
    }
    void grow(std::size_t count);

    // These two need room that ensure() has made.
    void putVarint(std::uint64_t value) noexcept {
        while (value >= 0x80) {
            *cursor_++ = static_cast<std::uint8_t>(value | 0x80);
            value >>= 7;
        }
        *cursor_++ = static_cast<std::uint8_t>(value);
    }
    void putKey(std::uint32_t fieldNumber, WireType wireType) noexcept {
        putVarint(static_cast<std::uint64_t>(fieldNumber) << 3 | static_cast<std::uint8_t>(wireType));
    }

    template <class Number>
    void writeFixed(Number value, WireType wireType, std::uint32_t fieldNumber) {
        ensure(longestKeyAndNumber);
        putKey(fieldNumber, wireType);
        std::memcpy(cursor_, &value, sizeof value);
        cursor_ += sizeof value;
    }
    void writeLengthDelimited(const void* bytes, std::size_t count, std::uint32_t fieldNumber);

    std::array<std::uint8_t, 512> inline_;
    std::unique_ptr<std::uint8_t[]> heap_; // in use once inline_ was too small
    std::uint8_t* begin_ = inline_.data();
    std::uint8_t* cursor_ = begin_;
    std::uint8_t* end_ = begin_ + inline_.size();
};

} // namespace tarn
