#pragma once

#include <optional>

#include <tarn/Client.h>

#include "roles/Data.h"

namespace tarn {

/// What the payloads and envelopes of the service say; none when the bytes are no such message.
std::optional<client::AssetInfo> decodeAssetInfo(const Data& payload);
std::optional<client::Status> decodeStatus(const Data& payload);
std::optional<double> decodeCurrentTime(const Data& payload);
std::optional<client::Event> decodeEvent(const Data& envelope);

} // namespace tarn
