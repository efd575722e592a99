#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "wire/Utf8.h"

namespace tarn {

/// How a value is laid out on the wire: the low three bits of a field's key.
enum class WireType : std::uint8_t {
    varint = 0,
    fixed64 = 1,
    lengthDelimited = 2,
    startGroup = 3,
    endGroup = 4,
    fixed32 = 5,
};

/// Reads Protocol Buffers values from bytes that it does not own.
///
/// Running past the end sets the error flag, which stays set; every read then yields zero or none. No read
/// touches a byte outside of [position, length) or allocates anything. One thread at a time.
class ProtoReader {
public:
    /// `bytes` outlives the reader and the views that it hands out. More than 2^32 - 1 bytes are an error.
    explicit ProtoReader(std::span<const std::uint8_t> bytes) noexcept;

    std::uint32_t position() const noexcept { return position_; }
    void setPosition(std::uint32_t position) noexcept { position_ = position; }

    /// The end of what may be read now: that of the innermost embedded message.
    std::uint32_t length() const noexcept { return length_; }
    void setLength(std::uint32_t length) noexcept { length_ = length; }

    bool hasError() const noexcept { return error_; }
    void setError(bool error) noexcept { error_ = error; }

    /// Zero when the bytes end first, and when ten bytes all announce a further one; only the former is an
    /// error.
    std::uint64_t readVarint() noexcept {
        if (position_ < length_ && bytes_[position_] < 0x80 && !error_)
            return bytes_[position_++];
        return readLongVarint();
    }

    double readDouble() noexcept;
    float readFloat() noexcept;

    /// A length-delimited value; none, and an error, when it runs past the end.
    std::optional<std::span<const std::uint8_t>> readData() noexcept {
        const std::uint64_t count = readVarint();
        const std::uint32_t start = position_;
        if (!skipBytes(count))
            return std::nullopt;
        return std::span(bytes_ + start, position_ - start);
    }

    /// A length-delimited value; none when it is not UTF-8, which is no error, or runs past the end, which
    /// is.
    std::optional<std::string_view> readString() noexcept {
        const auto data = readData();
        if (!data)
            return std::nullopt;
        const std::string_view text(reinterpret_cast<const char*>(data->data()), data->size());
        if (!isValidUtf8(text))
            return std::nullopt;
        return text;
    }

    /// Reads the length prefix of an embedded message and narrows the end to it; `mark` is for recallMark().
    /// False when the message runs past the end.
    bool placeMark(std::uint32_t& mark) noexcept {
        const std::uint64_t count = readVarint();
        if (error_ || count > length_ - position_)
            return false;
        mark = length_;
        length_ = position_ + static_cast<std::uint32_t>(count);
        return true;
    }

    /// Leaves the embedded message, also when it was not read to its end.
    void recallMark(std::uint32_t mark) noexcept {
        position_ = length_;
        length_ = mark;
    }

    /// Moves behind a value whose key has been read; false when that cannot be done.
    bool skipValue(std::uint32_t fieldNumber, WireType wireType) noexcept;

private:
    std::uint64_t readLongVarint() noexcept;
    bool skipBytes(std::uint64_t count) noexcept {
        if (error_ || count > length_ - position_) {
            error_ = true;
            return false;
        }
        position_ += static_cast<std::uint32_t>(count);
        return true;
    }
    bool skipGroup(std::uint32_t fieldNumber) noexcept;
    template <class Number>
    Number readFixed() noexcept;

    const std::uint8_t* bytes_;
    std::uint32_t position_ = 0;
    std::uint32_t length_;
    bool error_;
};

/// The two halves of a field's key.
struct ProtoKey {
    explicit ProtoKey(std::uint64_t key) noexcept
        : fieldNumber(static_cast<std::uint32_t>(key >> 3)), wireType(static_cast<WireType>(key & 7)) {}

    std::uint32_t fieldNumber;
    WireType wireType;
};

} // namespace tarn
