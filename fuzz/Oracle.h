#pragma once

#include <optional>
#include <span>

#include "roles/Data.h"

namespace tarn {

/// What decoding an envelope and encoding it again is to give; none when it is to be refused.
///
/// The wire rules a second time, written from scratch over plain bytes: no message objects, nothing shared
/// with the code that it judges.
std::optional<Data> expectedEncoding(std::span<const std::uint8_t> envelope);

} // namespace tarn
