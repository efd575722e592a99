#pragma once

#include "media/FilePorter.h"
#include "player/EventLoop.h"
#include "system/FileReceiver.h"

namespace tarn {

/// Has porters receive the files of clients. Any thread may call.
class ClientFiles final : public FileReceiver {
public:
    /// Both outlive this and its arrivals. A porter that does not answer is noticed on the loop.
    ClientFiles(FilePorter& porter, EventLoop& loop) : porter_(porter), loop_(loop) {}

    std::unique_ptr<Arrival> receive(int socket, std::size_t bytes) override;
    void drop(int socket) override;

private:
    class PortedArrival;

    FilePorter& porter_;
    EventLoop& loop_;
};

} // namespace tarn
