#include "decoder/Tags.h"

#include <cstring>
#include <optional>

#include "decoder/VorbisComments.h"
#include "wire/Utf8.h"

namespace tarn {

namespace {

constexpr std::size_t longestTag = 1024;
constexpr std::string_view replacement = "\xEF\xBF\xBD";

bool isControl(char32_t character) { return character < 0x20 || (character >= 0x7F && character < 0xA0); }

// Old taggers wrote Latin-1; then no multi-byte character is well-formed except by accident.
bool looksLikeLatin1(std::string_view text) {
    while (!text.empty()) {
        const std::size_t length = utf8CharacterLength(text);
        if (length > 1)
            return false;
        text.remove_prefix(1);
    }
    return true;
}

std::string_view trimmed(std::string_view text) {
    while (!text.empty() && text.front() == ' ')
        text.remove_prefix(1);
    while (!text.empty() && text.back() == ' ')
        text.remove_suffix(1);
    return text;
}

std::string latin1Character(char byte) {
    const auto value = static_cast<unsigned char>(byte);
    return {static_cast<char>(0xC0 | (value >> 6)), static_cast<char>(0x80 | (value & 0x3F))};
}

std::optional<std::string> textOf(const AVDictionary* dictionary, const char* key) {
    const AVDictionaryEntry* entry = av_dict_get(dictionary, key, nullptr, 0);
    std::string text = entry == nullptr ? "" : repairTagText(entry->value);
    return text.empty() ? std::nullopt : std::optional(std::move(text));
}

// FFmpeg gives the name of a Matroska track ("English", "Stereo") as its title. It is taken for one only when
// there are other tags of the track.
bool titleIsOfTrack(const Container& container, const char* key) {
    const AVDictionary* tags = container.stream().metadata;
    return container.isNamed("matroska") && std::strcmp(key, "title") == 0 && !textOf(tags, "artist") &&
           !textOf(tags, "album");
}

} // namespace

std::string repairTagText(std::string_view raw) {
    const bool latin1 = !isValidUtf8(raw) && looksLikeLatin1(raw);
    std::string text;
    while (!raw.empty()) {
        const std::size_t length = utf8CharacterLength(raw);
        std::string character;
        if (length > 0)
            character = isControl(utf8CharacterValue(raw, length)) ? " " : std::string(raw.substr(0, length));
        else if (latin1 && static_cast<unsigned char>(raw.front()) >= 0xA0)
            character = latin1Character(raw.front());
        else
            character = replacement;
        if (text.size() + character.size() > longestTag)
            break;
        text += character;
        raw.remove_prefix(length > 0 ? length : 1);
    }
    return std::string(trimmed(text));
}

void readTags(const Container& container, ByteSource& source, AudioFileInfo& info) {
    const AVFormatContext& context = container.context();
    const AVStream& stream = container.stream();
    const VorbisComments comments(source);
    const auto read = [&](const char* key) -> std::optional<std::string> {
        if (const auto comment = comments.first(key))
            if (std::string text = repairTagText(*comment); !text.empty())
                return text;
        if (auto text = textOf(context.metadata, key))
            return text;
        return titleIsOfTrack(container, key) ? std::nullopt : textOf(stream.metadata, key);
    };
    info.title = read("title");
    info.album = read("album");
    info.artist = read("artist");
    if (!info.artist)
        info.artist = read("author"); // of an AIFF file
}

} // namespace tarn
