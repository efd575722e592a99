#pragma once

#include <optional>
#include <string_view>

#include "roles/Localization.h"

namespace tarn {

/// Reads the text of a strings file: lines such as
///
///     /* a comment */
///     "key" = "text";      // quoted by " or ', or unquoted when it is a plain word
///
/// in UTF-8, or in UTF-16 with a byte order mark. A key without a text stands for itself; of two entries for
/// one key the later holds. Escapes: \" \' \\ \a \b \f \n \r \t \v, up to three octal digits, and \U or \u
/// with up to four hexadecimal digits.
///
/// None when anything in it cannot be read; no input does harm.
std::optional<Bundle::Strings> parseStringsFile(std::string_view bytes);

} // namespace tarn
