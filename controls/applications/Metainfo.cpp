#include "controls/applications/Metainfo.h"

#include <expat.h>

#include <algorithm>
#include <memory>
#include <type_traits>

namespace tarn {

namespace {

constexpr std::size_t textLimit = 1000;

struct ParserDeleter {
    void operator()(XML_Parser parser) const { XML_ParserFree(parser); }
};
using ParserHandle = std::unique_ptr<std::remove_pointer_t<XML_Parser>, ParserDeleter>;

std::string trimmed(const std::string& text) {
    constexpr const char* blanks = " \t\r\n";
    const std::size_t first = std::min(text.find_first_not_of(blanks), text.size());
    return text.substr(first, text.find_last_not_of(blanks) + 1 - first);
}

std::string_view attribute(const XML_Char** attributes, std::string_view name) {
    for (; *attributes; attributes += 2)
        if (name == attributes[0])
            return attributes[1];
    return {};
}

/// Collects the elements right below <component>; everything deeper is another matter.
class MetainfoReader {
public:
    explicit MetainfoReader(XML_Parser parser) : parser_(parser) {
        XML_SetUserData(parser, this);
        XML_SetElementHandler(parser, beginElement, endElement);
        XML_SetCharacterDataHandler(parser, addText);
        XML_SetStartDoctypeDeclHandler(parser, refuseDoctype);
    }

    Metainfo result;

private:
    static MetainfoReader& self(void* data) { return *static_cast<MetainfoReader*>(data); }

    static void XMLCALL beginElement(void* data, const XML_Char* name, const XML_Char** attributes) {
        self(data).begin(name, attributes);
    }

    static void XMLCALL endElement(void* data, const XML_Char* name) { self(data).end(name); }

    static void XMLCALL addText(void* data, const XML_Char* text, int length) {
        std::string& collected = self(data).text_;
        const std::size_t room = textLimit - collected.size();
        collected.append(text, std::min(static_cast<std::size_t>(length), room));
    }

    static void XMLCALL refuseDoctype(void* data, const XML_Char* /*name*/, const XML_Char* /*system*/,
                                      const XML_Char* /*publicName*/, int /*hasInternalSubset*/) {
        XML_StopParser(self(data).parser_, XML_FALSE);
    }

    void begin(std::string_view name, const XML_Char** attributes) {
        ++depth_;
        text_.clear();
        if (depth_ == 1)
            result.isAddon = name == "component" && attribute(attributes, "type") == "addon";
        else if (depth_ == 2)
            launchesDesktopEntry_ = name == "launchable" && attribute(attributes, "type") == "desktop-id";
    }

    void end(std::string_view name) {
        if (depth_ == 2) {
            const std::string text = trimmed(text_);
            if (name == "id" && result.identifier.empty())
                result.identifier = text;
            else if (name == "extends" && !text.empty())
                result.extends.push_back(text);
            else if (launchesDesktopEntry_ && !text.empty())
                result.desktopEntries.push_back(withoutDesktopSuffix(text));
        }
        --depth_;
        text_.clear();
    }

    XML_Parser parser_;
    int depth_ = 0;
    bool launchesDesktopEntry_ = false;
    std::string text_;
};

} // namespace

std::optional<Metainfo> parseMetainfo(std::string_view xml) {
    const ParserHandle parser(XML_ParserCreate(nullptr));
    MetainfoReader reader(parser.get());
    if (XML_Parse(parser.get(), xml.data(), static_cast<int>(xml.size()), XML_TRUE) != XML_STATUS_OK)
        return std::nullopt;
    return reader.result.identifier.empty() ? std::nullopt : std::optional(std::move(reader.result));
}

std::string withoutDesktopSuffix(std::string_view name) {
    constexpr std::string_view suffix = ".desktop";
    if (name.ends_with(suffix))
        name.remove_suffix(suffix.size());
    return std::string(name);
}

} // namespace tarn
