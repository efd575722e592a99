#pragma once

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>
#include <optional>
#include <string>
#include <string_view>

#include "wire/Utf8.h"

namespace tarn {

/// A text, or none, that stands in a message of fixed size. What another process has filled in is checked
/// before it is believed.
template <std::size_t Capacity>
class FixedText {
public:
    /// Cut to the capacity, between two characters.
    void set(const std::optional<std::string>& text) {
        bytes_ = {};
        length_ = absent;
        if (!text)
            return;
        std::size_t length = 0;
        while (length < text->size()) {
            const std::size_t character = utf8CharacterLength(std::string_view(*text).substr(length));
            if (character == 0 || length + character > Capacity)
                break;
            length += character;
        }
        length_ = static_cast<std::uint32_t>(length);
        std::memcpy(bytes_.data(), text->data(), length);
    }

    /// Is it none, or well-formed UTF-8 without control characters?
    bool valid() const {
        if (length_ == absent)
            return true;
        return length_ <= Capacity && isValidUtf8(view()) &&
               std::none_of(view().begin(), view().end(), isControl);
    }

    /// Of a valid text.
    std::optional<std::string> text() const {
        return length_ == absent ? std::nullopt : std::optional(std::string(view()));
    }

private:
    static constexpr std::uint32_t absent = 0xFFFFFFFF;

    static bool isControl(char character) {
        const auto value = static_cast<unsigned char>(character);
        return value < 0x20 || value == 0x7F;
    }

    std::string_view view() const { return {bytes_.data(), length_}; }

    std::uint32_t length_ = absent;
    std::array<char, Capacity> bytes_{};
};

} // namespace tarn
