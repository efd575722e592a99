#pragma once

#include <string>
#include <string_view>

#include "wire/Dictionary.h"

namespace tarn::tool {

enum class LineFormat { text, JSON };

/// One line without its line feed: `answer call=3 duration=12.5 title="A song"`, or
/// `{"type":"answer","call":3,"duration":12.5,"title":"A song"}`. Fields come sorted by their names.
std::string outputLine(LineFormat format, std::string_view type, const Dictionary& fields);

/// A value as a person types it: text as it is, everything else as in a line of text.
std::string plainText(const DictionaryValue& value);

} // namespace tarn::tool
