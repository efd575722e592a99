#include "client/tool/display/OutputLine.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <type_traits>

#include "wire/Utf8.h"

namespace tarn::tool {

namespace {

std::string inQuotes(std::string_view text) {
    constexpr std::string_view digits = "0123456789abcdef";
    std::string out = "\"";
    while (!text.empty()) {
        const auto length = utf8CharacterLength(text);
        const auto code = static_cast<unsigned char>(text.front());
        if (length == 0) // as in the name of a file, which may be any bytes
            out.append("\\ufffd");
        else if (code == '"' || code == '\\')
            out.append({'\\', text.front()});
        else if (code < 0x20 || code == 0x7F)
            out.append("\\u00").append({digits[code >> 4U], digits[code & 0xFU]});
        else
            out.append(text.substr(0, length));
        text.remove_prefix(std::max<std::size_t>(length, 1));
    }
    return out + "\"";
}

std::string hexadecimal(const Data& bytes) {
    constexpr std::string_view digits = "0123456789abcdef";
    std::string out;
    for (const unsigned byte : bytes)
        out.append({digits[byte >> 4U], digits[byte & 0xFU]});
    return out;
}

template <class Number>
std::string number(Number value) {
    std::array<char, 32> text{};
    const auto result = std::to_chars(text.data(), text.data() + text.size(), value);
    return {text.data(), result.ptr};
}

std::string objectText(LineFormat format, const Dictionary& dictionary);
std::string listText(LineFormat format, const DictionaryList& list);

std::string valueText(LineFormat format, const DictionaryValue& value) {
    return std::visit(
        [&](const auto& held) -> std::string {
            using Held = std::decay_t<decltype(held)>;
            if constexpr (std::is_same_v<Held, std::string>)
                return inQuotes(held);
            else if constexpr (std::is_same_v<Held, Data>)
                return inQuotes(hexadecimal(held));
            else if constexpr (std::is_same_v<Held, Dictionary>)
                return objectText(format, held);
            else if constexpr (std::is_same_v<Held, DictionaryList>)
                return listText(format, held);
            else if constexpr (std::is_same_v<Held, bool>)
                return held ? "true" : "false";
            else if constexpr (std::is_floating_point_v<Held>)
                return std::isfinite(held) || format == LineFormat::text ? number(held) : "null";
            else
                return number(held);
        },
        value.value);
}

std::string objectText(LineFormat format, const Dictionary& dictionary) {
    std::string text;
    for (const auto& [key, value] : dictionary) {
        text += text.empty() ? "{" : format == LineFormat::JSON ? "," : " ";
        text += format == LineFormat::JSON ? inQuotes(key) + ":" : key + "=";
        text += valueText(format, value);
    }
    return text.empty() ? "{}" : text + "}";
}

std::string listText(LineFormat format, const DictionaryList& list) {
    std::string text;
    for (const auto& value : list)
        text += (text.empty() ? "[" : ",") + valueText(format, value);
    return text.empty() ? "[]" : text + "]";
}

} // namespace

std::string outputLine(LineFormat format, std::string_view type, const Dictionary& fields) {
    std::string line;
    if (format == LineFormat::text) {
        line = type;
        for (const auto& [key, value] : fields)
            line += " " + key + "=" + valueText(format, value);
        return line;
    }
    line = "{\"type\":" + inQuotes(type);
    for (const auto& [key, value] : fields)
        line += "," + inQuotes(key) + ":" + valueText(format, value);
    return line + "}";
}

std::string plainText(const DictionaryValue& value) {
    const auto* text = std::get_if<std::string>(&value.value);
    return text != nullptr ? *text : valueText(LineFormat::text, value);
}

} // namespace tarn::tool
