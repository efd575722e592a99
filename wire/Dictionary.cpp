#include "wire/Dictionary.h"

#include <concepts>
#include <cstdio>
#include <limits>

namespace tarn {

namespace {

constexpr std::size_t indentWidth = 4;

/// Appends values to a text, nested ones indented.
class Describer {
public:
    std::string take() { return std::move(text_); }

    void append(const Dictionary& dictionary) {
        text_ += "{\n";
        ++depth_;
        for (const auto& [key, value] : dictionary) {
            indent();
            text_ += key;
            text_ += " = ";
            append(value);
            text_ += ";\n";
        }
        --depth_;
        indent();
        text_ += '}';
    }

private:
    void append(const DictionaryValue& value) {
        std::visit([this](const auto& held) { append(held); }, value.value);
    }

    void append(const DictionaryList& list) {
        text_ += "(\n";
        ++depth_;
        for (const auto& element : list) {
            indent();
            append(element);
            text_ += ",\n";
        }
        --depth_;
        indent();
        text_ += ')';
    }

    void append(const std::string& text) {
        text_ += '"';
        text_ += text;
        text_ += '"';
    }

    void append(const Data& data) {
        static constexpr char digits[] = "0123456789abcdef";
        text_ += '<';
        for (const std::uint8_t byte : data) {
            text_ += digits[byte >> 4];
            text_ += digits[byte & 0xF];
        }
        text_ += '>';
    }

    void append(bool value) { text_ += value ? '1' : '0'; }

    template <std::integral Number>
    void append(Number number) {
        text_ += std::to_string(number);
    }

    template <std::floating_point Number>
    void append(Number number) {
        char buffer[32];
        const int length =
            std::snprintf(buffer, sizeof buffer, "%.*g", std::numeric_limits<Number>::max_digits10,
                          static_cast<double>(number));
        text_.append(buffer, static_cast<std::size_t>(length));
    }

    void indent() { text_.append(depth_ * indentWidth, ' '); }

    std::string text_;
    std::size_t depth_ = 0;
};

} // namespace

std::string description(const Dictionary& dictionary) {
    Describer describer;
    describer.append(dictionary);
    return describer.take();
}

} // namespace tarn
