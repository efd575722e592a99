#pragma once

#include <memory>
#include <string>

#include "roles/ServiceConnection.h"

namespace tarn {

class ServiceListener;

/// Is offered every new connection.
class ServiceListenerDelegate {
public:
    virtual ~ServiceListenerDelegate() = default;

    /// On the I/O thread. False refuses the connection.
    virtual bool listenerShouldAcceptNewConnection(ServiceListener& listener,
                                                   const std::shared_ptr<ServiceConnection>& connection) = 0;
};

/// Listens on a named service.
class ServiceListener {
public:
    virtual ~ServiceListener() = default;

    /// The delegate is not owned and outlives the listener.
    virtual void setDelegate(ServiceListenerDelegate* delegate) = 0;

    /// From now on connections are offered.
    virtual void resume() = 0;
};

/// Makes listeners.
class ServiceListeners {
public:
    virtual ~ServiceListeners() = default;
    virtual std::unique_ptr<ServiceListener> createWithServiceName(const std::string& name) = 0;
};

} // namespace tarn
