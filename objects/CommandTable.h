#pragma once

#include <memory>
#include <tuple>
#include <utility>

#include "roles/Reply.h"

namespace tarn {

/// One row of a manager's table: the field of its message that carries the command, and what serves it.
template <class Message, class Payload, class Manager>
struct Command {
    const std::shared_ptr<Payload>& (Message::*field)() const;
    void (Manager::*serve)(const Payload& payload, Reply reply);

    /// False when the message does not hold this command.
    bool serveIfPresent(Manager& manager, const Message& message, Reply& reply) const {
        const std::shared_ptr<Payload>& payload = (message.*field)();
        if (payload)
            (manager.*serve)(*payload, std::move(reply));
        return payload != nullptr;
    }
};

template <class Message, class Payload, class Manager>
Command(const std::shared_ptr<Payload>& (Message::*)() const, void (Manager::*)(const Payload&, Reply))
    -> Command<Message, Payload, Manager>;

/// Serves the first command of `table` that the message holds; the rows behind it are not looked at. Without
/// any, the reply is let go unanswered.
template <class Manager, class Message, class... Rows>
void serveFirstCommand(const std::tuple<Rows...>& table, Manager& manager, const Message& message,
                       Reply reply) {
    std::apply([&](const Rows&... rows) { (void)(rows.serveIfPresent(manager, message, reply) || ...); },
               table);
}

} // namespace tarn
