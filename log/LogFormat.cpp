#include "log/LogFormat.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdint>
#include <type_traits>
#include <variant>

#include "wire/Utf8.h"

namespace tarn {

namespace {

constexpr std::string_view cutMark = "...";

/// Line separators, other controls, and the marks that reverse the direction of what follows them.
bool isHarmful(char32_t character) {
    return character < 0x20 || (character >= 0x7F && character < 0xA0) || character == 0x2028 ||
           character == 0x2029 || character == 0x061C || character == 0x200E || character == 0x200F ||
           (character >= 0x202A && character <= 0x202E) || (character >= 0x2066 && character <= 0x2069);
}

template <std::integral T>
void appendNumber(std::string& out, T value, int base = 10) {
    std::array<char, 24> digits{};
    const auto result = std::to_chars(digits.data(), digits.data() + digits.size(), value, base);
    out.append(digits.data(), result.ptr);
}

void appendEscaped(std::string& out, char32_t character) {
    switch (character) {
    case '\n':
        out += "\\n";
        return;
    case '\r':
        out += "\\r";
        return;
    case '\t':
        out += "\\t";
        return;
    default:
        out += "\\u{";
        appendNumber(out, static_cast<std::uint32_t>(character), 16);
        out += '}';
    }
}

/// Appends `text` made harmless; what would take more than `limit` bytes is cut and ends in the mark.
void appendText(std::string& out, std::string_view text, std::size_t limit) {
    const std::size_t start = out.size();
    std::size_t cutPosition = start;
    while (!text.empty()) {
        const std::size_t length = utf8CharacterLength(text);
        if (length == 0)
            out += "\xEF\xBF\xBD";
        else if (const char32_t character = utf8CharacterValue(text, length); isHarmful(character))
            appendEscaped(out, character);
        else
            out += text.substr(0, length);
        if (out.size() - start > limit) {
            out.resize(cutPosition);
            out += cutMark;
            return;
        }
        if (out.size() - start <= limit - cutMark.size())
            cutPosition = out.size();
        text.remove_prefix(std::max<std::size_t>(length, 1));
    }
}

/// What stands between a percent sign and the letter that ends it.
struct Placeholder {
    char conversion = 0;
    int precision = -1;
    bool isPublic = false;
    bool isPrivate = false;
};

/// Takes one placeholder, without its percent sign, off the front of `format`.
Placeholder takePlaceholder(std::string_view& format) {
    Placeholder placeholder;
    if (format.starts_with('{')) {
        const std::string_view options = format.substr(0, format.find('}'));
        placeholder.isPublic = options.find("public") != options.npos;
        placeholder.isPrivate = options.find("private") != options.npos;
        format.remove_prefix(std::min(options.size() + 1, format.size()));
    }
    const std::size_t size = std::min(format.find_first_not_of("-+ #0123456789.hlqjztL"), format.size());
    const std::string_view modifiers = format.substr(0, size);
    if (const std::size_t point = modifiers.find('.'); point != modifiers.npos)
        std::from_chars(modifiers.data() + point + 1, modifiers.data() + modifiers.size(),
                        placeholder.precision);
    format.remove_prefix(size);
    if (!format.empty()) {
        placeholder.conversion = format.front();
        format.remove_prefix(1);
    }
    return placeholder;
}

void appendReal(std::string& out, const Placeholder& placeholder, double value) {
    std::array<char, 400> digits{};
    const bool isFixed = placeholder.conversion == 'f';
    const int precision = std::min(placeholder.precision >= 0 ? placeholder.precision : 6, 30);
    const auto result = isFixed ? std::to_chars(digits.data(), digits.data() + digits.size(), value,
                                                std::chars_format::fixed, precision)
                                : std::to_chars(digits.data(), digits.data() + digits.size(), value);
    out.append(digits.data(), result.ptr);
}

void appendArgument(std::string& out, const Placeholder& placeholder, const LogArgument& argument) {
    const bool isText = std::holds_alternative<std::string_view>(argument.value());
    if (placeholder.isPrivate || (isText && !placeholder.isPublic)) {
        out += "<private>";
        return;
    }
    std::visit(
        [&](const auto& value) {
            using Value = std::decay_t<decltype(value)>;
            if constexpr (std::is_same_v<Value, std::string_view>) {
                appendText(out, value, logTextLimit);
            } else if constexpr (std::is_same_v<Value, double>) {
                appendReal(out, placeholder, value);
            } else if constexpr (std::is_same_v<Value, std::int64_t>) {
                appendNumber(out, value, placeholder.conversion == 'x' ? 16 : 10);
            } else {
                out += "0x";
                appendNumber(out, reinterpret_cast<std::uintptr_t>(value), 16);
            }
        },
        argument.value());
}

/// The method and the line, then what the caller gave: the arguments in the order of the placeholders.
class ArgumentList {
public:
    ArgumentList(std::string_view method, int line, std::initializer_list<LogArgument> arguments)
        : prefix_{LogArgument(method), LogArgument(line)}, arguments_(arguments) {}

    const LogArgument* next() {
        const std::size_t index = next_++;
        if (index < prefix_.size())
            return &prefix_[index];
        const std::size_t rest = index - prefix_.size();
        return rest < arguments_.size() ? arguments_.begin() + rest : nullptr;
    }

private:
    std::array<LogArgument, 2> prefix_;
    std::initializer_list<LogArgument> arguments_;
    std::size_t next_ = 0;
};

} // namespace

std::string formatLogMessage(std::string_view method, int line, std::string_view format,
                             std::initializer_list<LogArgument> arguments) {
    ArgumentList list(method, line, arguments);
    std::string out;
    while (!format.empty()) {
        const std::size_t percent = std::min(format.find('%'), format.size());
        out += format.substr(0, percent);
        format.remove_prefix(percent);
        if (format.empty())
            break;
        format.remove_prefix(1);
        const Placeholder placeholder = takePlaceholder(format);
        if (placeholder.conversion == '%')
            out += '%';
        else if (const LogArgument* argument = list.next())
            appendArgument(out, placeholder, *argument);
        else
            out += "<missing>";
    }
    if (out.size() <= logMessageLimit)
        return out;
    std::string cut;
    appendText(cut, out, logMessageLimit);
    return cut;
}

} // namespace tarn
