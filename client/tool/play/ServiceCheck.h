#pragma once

#include <chrono>

#include <tarn/Client.h>

namespace tarn::tool {

/// Throws std::runtime_error with a text for a person when nothing has answered by then. A service manager
/// holds the socket and lets programs connect even when the service itself does not come up.
void checkThatServiceAnswers(client::Client& client,
                             std::chrono::milliseconds limit = std::chrono::seconds(10));

} // namespace tarn::tool
