#include "proto/TextList.h"

namespace tarn {

TextList::TextList(std::initializer_list<std::string_view> texts) {
    for (const std::string_view text : texts)
        push_back(text);
}

TextList::TextList(const std::vector<std::string>& texts) {
    for (const auto& text : texts)
        push_back(text);
}

void TextList::append(const TextList& other) {
    // The two may be one list. NOLINTNEXTLINE(performance-unnecessary-copy-initialization)
    const TextList added = other;
    for (std::size_t index = 0; index < added.size(); ++index)
        push_back(added.at(index));
}

void TextList::clear() {
    characters_.clear();
    ends_.clear();
}

void TextList::reserve(std::size_t characters) { characters_.reserve(characters); }

} // namespace tarn
