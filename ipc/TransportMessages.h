#pragma once

#include <optional>
#include <span>
#include <string>

#include "roles/Data.h"
#include "roles/Error.h"

namespace tarn {

class ProtoWriter;

/// A client's grant: `token` stands for the file at `path`.
struct Extension {
    std::string token;
    std::string path;
};

/// How a call was answered.
struct CallReply {
    std::optional<Data> data;
    std::optional<Error> error;
};

/// The bodies of frames, encoded and decoded. Decoding yields none when the bytes are no such message or lack
/// what it must have.
Data encodeExtension(const Extension& extension);
std::optional<Extension> decodeExtension(std::span<const std::uint8_t> body);
void writeReply(std::optional<Data> data, const std::optional<Error>& error, ProtoWriter& writer);
std::optional<CallReply> decodeReply(std::span<const std::uint8_t> body);

} // namespace tarn
