#include "wire/ProtoWriter.h"

#include <algorithm>

#include "wire/ProtoCodable.h"

namespace tarn {

namespace {

std::size_t varintSize(std::uint64_t value) noexcept {
    std::size_t size = 1;
    while (value >>= 7)
        ++size;
    return size;
}

} // namespace

void ProtoWriter::writeUint64(std::uint64_t value, std::uint32_t fieldNumber) {
    ensure(longestKeyAndNumber);
    putKey(fieldNumber, WireType::varint);
    putVarint(value);
}

/// The length is known only afterwards: one byte is set aside for it, and a body that needs a longer length
/// is moved. Nearly all bodies are short, and a message nests only a few levels deep.
void ProtoWriter::writeMessage(const ProtoCodable& message, std::uint32_t fieldNumber) {
    ensure(longestKeyAndNumber);
    putKey(fieldNumber, WireType::lengthDelimited);
    const std::ptrdiff_t start = cursor_ - begin_;
    ++cursor_;
    message.writeTo(*this);

    ensure(longestVarint);
    std::uint8_t* const body = begin_ + start + 1;
    const auto bodySize = static_cast<std::size_t>(cursor_ - body);
    const std::size_t lengthSize = varintSize(bodySize);
    if (lengthSize > 1)
        std::memmove(begin_ + start + lengthSize, body, bodySize);
    cursor_ = begin_ + start;
    putVarint(bodySize);
    cursor_ += bodySize;
}

void ProtoWriter::writeLengthDelimited(const void* bytes, std::size_t count, std::uint32_t fieldNumber) {
    ensure(longestKeyAndNumber + count);
    putKey(fieldNumber, WireType::lengthDelimited);
    putVarint(count);
    if (count > 0)
        std::memcpy(cursor_, bytes, count);
    cursor_ += count;
}

void ProtoWriter::grow(std::size_t count) {
    const auto used = static_cast<std::size_t>(cursor_ - begin_);
    const auto capacity = std::max(2 * static_cast<std::size_t>(end_ - begin_), used + count);
    auto larger = std::make_unique_for_overwrite<std::uint8_t[]>(capacity);
    std::memcpy(larger.get(), begin_, used);
    heap_ = std::move(larger);
    begin_ = heap_.get();
    cursor_ = begin_ + used;
    end_ = begin_ + capacity;
}

} // namespace tarn
