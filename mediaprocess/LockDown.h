#pragma once

#include <cstdint>

#include "mediaprotocol/Messages.h"

namespace tarn {

/// The private memory of this process, used or not, in bytes; 0 when the system does not tell.
std::uint64_t privateMemory();

/// Gives up everything that decoding does not need, for good: from now on this process opens, writes,
/// connects, signals and executes nothing, gains no rights, and has at most 192 MiB of memory more than
/// `ownMemory`. Returns what is in force. Without threads.
std::uint32_t lockDown(std::uint64_t ownMemory);

} // namespace tarn
