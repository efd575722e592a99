#pragma once

#include <string>
#include <string_view>

namespace tarn::tool {

/// The first columns of a text, with an ellipsis when something was cut off. Characters that a terminal would
/// take as commands become question marks.
std::string fitColumns(const std::string& text, int columns);

/// All of a text, in one line: what is no character or controls a terminal becomes question marks.
std::string printable(std::string_view text);

/// Columns that a text takes on a terminal.
int columnsOf(const std::string& text);

} // namespace tarn::tool
