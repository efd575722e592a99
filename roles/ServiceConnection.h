#pragma once

#include <functional>
#include <memory>
#include <vector>

#include "roles/Data.h"
#include "roles/Reply.h"

namespace tarn {

/// One call as it arrived: the bytes of an envelope, and the way to answer it.
struct ReceivedCall {
    Data data;
    Reply reply;
};

/// What the service offers on every connection.
class VLLongFormAudioServerProtocol {
public:
    virtual ~VLLongFormAudioServerProtocol() = default;

    /// On the I/O thread. Takes the calls that one read brought, in order; when this returns they are queued.
    virtual void receiveData(std::vector<ReceivedCall> calls) = 0;
};

/// What the client offers to the service.
class VLLongFormAudioClientProtocol {
public:
    virtual ~VLLongFormAudioClientProtocol() = default;

    /// From any thread; never blocks; a delivery that fails is not reported here.
    virtual void receiveData(const Data& data) = 0;
};

/// A client's connection. Shared by the service while it is current and by the platform until its peer goes.
///
/// Exactly one of the two handlers runs, once, on the I/O thread, never inside a send; also when the loss
/// came before the handlers were set. Letting a connection go does not close it.
///
/// Object and handlers are set, and the connection is resumed, while it is offered to the delegate;
/// remoteObjectProxy() is for any thread.
class ServiceConnection {
public:
    virtual ~ServiceConnection() = default;

    virtual void setExportedObject(std::shared_ptr<VLLongFormAudioServerProtocol> object) = 0;

    /// From now on calls are delivered.
    virtual void resume() = 0;

    /// The connection broke.
    virtual void setInterruptionHandler(std::function<void()> handler) = 0;
    /// The peer ended the connection.
    virtual void setInvalidationHandler(std::function<void()> handler) = 0;

    virtual VLLongFormAudioClientProtocol& remoteObjectProxy() = 0;
};

} // namespace tarn
