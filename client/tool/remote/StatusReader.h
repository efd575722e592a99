#pragma once

#include <systemd/sd-bus.h>

#include <string>

#include "client/tool/remote/PlayerStatus.h"

namespace tarn::tool {

/// Reads all properties of a player from the answer that brings them. What it does not know, or has another
/// type than it should, is passed over.
PlayerStatus readStatus(sd_bus_message* message);

/// Reads a text from the variant at the front; empty when it holds none.
std::string readText(sd_bus_message* message);

} // namespace tarn::tool
