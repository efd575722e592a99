#pragma once

#include <chrono>

#include <tarn/Client.h>

namespace tarn::tool {

/// Throws std::runtime_error with a text for a person when nothing has answered by then. A service manager
/// holds the socket and lets programs connect even when the service itself does not come up.
void checkThatServiceAnswers(client::Client& client,
                             std::chrono::milliseconds limit = std::chrono::seconds(10));

/// Was a command not carried out because this program is not the service's client any more, or its objects
/// are not there? Its objects have names of their own, so that only the service can have lost them.
bool wasForgotten(const client::Completion& completion);

/// Asks the service whether no program at all is its client. It forgets the client that it has when one that
/// was replaced leaves after all. Whoever was forgotten so may connect anew without taking over from anybody.
bool servesNobody(client::Client& client);

} // namespace tarn::tool
