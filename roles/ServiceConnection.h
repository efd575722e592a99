#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <vector>

#include "roles/Data.h"
#include "roles/Error.h"

namespace tarn {

/// The way back to the client for one call. Move-only through unique_ptr; any thread may use or destroy it.
///
/// Destroying it uncalled tells the client that no answer will come. A second call is ignored.
class ClientCallback {
public:
    virtual ~ClientCallback() = default;
    virtual void call(std::optional<Data> data, const std::optional<Error>& error) = 0;
};

/// One call as it arrived: the bytes of an envelope, and its callback. When the client wants no answer, the
/// callback is null or drops what it is called with.
///
/// A callback is kept until its call is done with: by the callbacks that live the transport knows how much a
/// client has sent ahead, and when to stop reading.
struct ReceivedCall {
    Data data;
    std::unique_ptr<ClientCallback> callback;
};

/// What the service offers on every connection.
class VLLongFormAudioServerProtocol {
public:
    virtual ~VLLongFormAudioServerProtocol() = default;

    /// On the I/O thread. Takes the calls that arrived together, in order; they are queued before anything
    /// that the thread calls next.
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
