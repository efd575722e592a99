#pragma once

#include <optional>
#include <string>

namespace tarn {

/// Where the buses are, as the environment says; an empty address when there is none.
std::string sessionBusAddress();
std::string systemBusAddress();

/// The socket file that the address begins with; none when it is of another kind.
std::optional<std::string> busSocketPath(const std::string& address);

} // namespace tarn
