#pragma once

#include <memory>

#include <tarn/Connection.h>

#include "client/libtarn/Link.h"

namespace tarn::client {

/// A link of its own, or the one of a Client.
class [[gnu::visibility("hidden")]] Connection::Implementation {
public:
    explicit Implementation(std::shared_ptr<Link> given) : link(std::move(given)) {}

    bool isLeftBehind() const { return link->mark().isLeftBehind(); }

    const std::shared_ptr<Link> link;
};

} // namespace tarn::client
