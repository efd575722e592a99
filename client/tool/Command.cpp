#include "client/tool/Command.h"

#include <charconv>
#include <stdexcept>
#include <tuple>
#include <type_traits>

#include "client/libtarn/ErrorTexts.h"
#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/VelmoMessage.h"
#include "wire/ProtoWriter.h"

namespace tarn::tool {

namespace {

// Names, numbers and types come from the field tables of the messages, so every command and field is here.

constexpr unsigned audioMessageNumber = 2; // in the envelope

template <class Message, class Visitor>
void forEachField(Visitor visit) {
    std::apply([&](const auto&... row) { (visit(row), ...); }, Message::fields());
}

/// Calls `visit(kind, command)` with the two rows that name each command, and its payload's type by tag.
template <class Visitor>
void forEachCommand(Visitor visit) {
    forEachField<VLProtoAudioFilePlayerMessage>([&](const auto& kind) {
        using Container = typename std::decay_t<decltype(kind)>::Value::element_type;
        forEachField<Container>([&](const auto& command) {
            using Payload = typename std::decay_t<decltype(command)>::Value::element_type;
            visit(kind, command, std::type_identity<Payload>());
        });
    });
}

template <class Kind, class Command>
std::string nameOf(const Kind& kind, const Command& command) {
    return std::string(kind.name) + "." + std::string(command.name);
}

template <class Number>
Number parseNumber(std::string_view field, const std::string& text) {
    Number number{};
    const auto result = std::from_chars(text.data(), text.data() + text.size(), number);
    if (result.ec != std::errc() || result.ptr != text.data() + text.size())
        throw std::invalid_argument(std::string(field) + " takes a number, not '" + text + "'");
    return number;
}

Data parseHexadecimal(std::string_view field, const std::string& text) {
    Data bytes;
    for (std::size_t i = 0; i < text.size(); i += 2) {
        std::uint8_t byte = 0;
        const auto* end = text.data() + std::min(i + 2, text.size());
        if (std::from_chars(text.data() + i, end, byte, 16).ptr != end)
            throw std::invalid_argument(std::string(field) + " takes hexadecimal digits, not '" + text + "'");
        bytes.push_back(byte);
    }
    return bytes;
}

template <class Value>
void writeValue(ProtoWriter& writer, std::string_view field, unsigned number, const std::string& text) {
    if constexpr (std::is_same_v<Value, float>)
        writer.writeFloat(parseNumber<float>(field, text), number);
    else if constexpr (std::is_same_v<Value, double>)
        writer.writeDouble(parseNumber<double>(field, text), number);
    else if constexpr (std::is_arithmetic_v<Value>)
        writer.writeInt64(parseNumber<std::int64_t>(field, text), number);
    else if constexpr (std::is_same_v<Value, std::optional<Data>>)
        writer.writeData(parseHexadecimal(field, text), number);
    else
        writer.writeString(text, number);
}

template <class Payload>
Data encodePayload(const std::vector<std::string>& words) {
    ProtoWriter writer;
    for (std::size_t i = 1; i < words.size(); ++i) {
        const auto equals = words[i].find('=');
        const auto field = words[i].substr(0, equals);
        const auto text = equals == std::string::npos ? std::string() : words[i].substr(equals + 1);
        bool found = false;
        forEachField<Payload>([&](const auto& row) {
            if (row.name != field || equals == std::string::npos)
                return;
            found = true;
            writeValue<typename std::decay_t<decltype(row)>::Value>(writer, row.name, row.number, text);
        });
        if (!found)
            throw std::invalid_argument(words[0] + " has no field '" + field + "'");
    }
    return writer.data();
}

Data wrapped(const Data& bytes, unsigned number) {
    ProtoWriter writer;
    writer.writeData(bytes, number);
    return writer.data();
}

/// A status carries an error's texts as a property list: shown as the texts that they are.
void showErrorTexts(Dictionary& fields) {
    const auto found = fields.find("errorDict");
    if (found == fields.end() || !std::holds_alternative<Data>(found->second.value))
        return;
    Dictionary texts;
    for (const auto& [key, text] : readErrorTexts(std::get<Data>(found->second.value)))
        texts[key].value = text;
    found->second.value = std::move(texts);
}

template <class Message>
Dictionary decode(const Data& payload) {
    Dictionary fields;
    if (const auto message = Message::fromData(payload))
        fields = message->dictionaryRepresentation();
    else
        fields["bytes"].value = payload;
    showErrorTexts(fields);
    return fields;
}

} // namespace

std::vector<std::string> splitLine(std::string_view line) {
    std::vector<std::string> words;
    bool inWord = false;
    char quote = 0;
    for (std::size_t i = 0; i < line.size(); ++i) {
        const char character = line[i];
        const bool blank = quote == 0 && (character == ' ' || character == '\t' || character == '\r');
        if (!blank && !inWord)
            words.emplace_back();
        inWord = !blank;
        if (blank)
            continue;
        if (quote == 0 && (character == '"' || character == '\''))
            quote = character;
        else if (quote != 0 && character == quote)
            quote = 0;
        else if (character == '\\' && quote != '\'' && i + 1 < line.size())
            words.back() += line[++i];
        else
            words.back() += character;
    }
    if (quote != 0)
        throw std::invalid_argument("a quote is not closed");
    return words;
}

Data encodeCommand(const std::vector<std::string>& words) {
    Data envelope;
    bool found = false;
    forEachCommand([&](const auto& kind, const auto& command, auto payload) {
        if (found || words.empty() || words[0] != nameOf(kind, command))
            return;
        found = true;
        const auto bytes = encodePayload<typename decltype(payload)::type>(words);
        envelope = wrapped(wrapped(wrapped(bytes, command.number), kind.number), audioMessageNumber);
    });
    if (!found)
        throw std::invalid_argument("there is no command '" + (words.empty() ? "" : words[0]) + "'");
    return envelope;
}

Dictionary decodeAnswer(std::string_view command, const Data& payload) {
    if (command == "asset.upsertWithMetaData")
        return decode<VLProtoAudioFilePlayerAssetUpdateMetaData>(payload);
    if (command == "playerItem.getCurrentTime")
        return decode<VLProtoAudioFilePlayerCurrentTime>(payload);
    return decode<VLProtoAudioFilePlayerStatus>(payload);
}

NamedMessage decodeEnvelope(const Data& envelope) {
    const auto message = VLProtoVelmoMessage::fromData(envelope);
    if (!message || !message->audioFilePlayerMessage())
        return {};
    auto dictionary = message->audioFilePlayerMessage()->dictionaryRepresentation();
    NamedMessage named;
    forEachCommand([&](const auto& kind, const auto& command, auto) {
        const auto container = dictionary.find(kind.name);
        if (!named.name.empty() || container == dictionary.end())
            return;
        auto& commands = std::get<Dictionary>(container->second.value);
        if (const auto found = commands.find(command.name); found != commands.end())
            named = {nameOf(kind, command), std::move(std::get<Dictionary>(found->second.value))};
    });
    showErrorTexts(named.fields);
    return named;
}

std::string describeCommands() {
    std::string text;
    forEachCommand([&](const auto& kind, const auto& command, auto payload) {
        text += "  " + nameOf(kind, command);
        forEachField<typename decltype(payload)::type>(
            [&](const auto& field) { text += " " + std::string(field.name) + "="; });
        text += "\n";
    });
    return text;
}

} // namespace tarn::tool
