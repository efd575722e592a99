#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "roles/Data.h"
#include "wire/Dictionary.h"

namespace tarn::tool {

/// The words of a line: separated by blanks, with quotes and backslashes as a shell has them. Throws
/// std::invalid_argument when a quote is not closed.
std::vector<std::string> splitLine(std::string_view line);

/// The envelope of a command given as its name and fields: "playerItem.upsertWithAsset", "identifier=song",
/// "containedIdentifier=file". A repeated field is given once for each element; bytes in hexadecimal digits.
/// Throws std::invalid_argument when there is no such command or field, or a value does not fit.
Data encodeCommand(const std::vector<std::string>& words);

/// The payload that answers the command of that name, by field name. Bytes that cannot be decoded are there
/// as "bytes".
Dictionary decodeAnswer(std::string_view command, const Data& payload);

/// What an envelope says.
struct NamedMessage {
    std::string name; // "playerItem.setStatus"; empty when it says nothing
    Dictionary fields;
};
NamedMessage decodeEnvelope(const Data& envelope);

/// One line for each command and event: its name and its fields.
std::string describeCommands();

} // namespace tarn::tool
