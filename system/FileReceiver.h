#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string_view>
#include <vector>

#include "system/HeldFile.h"

namespace tarn {

/// A file that another process sent: it is held, or was refused for a reason.
struct ReceivedFile {
    HeldFile file;
    std::string_view refusal; ///< a constant; empty when there is a file

    explicit operator bool() const { return file.form != FileForm::none || !refusal.empty(); }
};

/// Takes open files out of sockets for the service, which must not have them in its own hands: closing one
/// may take as long as its sender likes. I/O thread.
class FileReceiver {
public:
    virtual ~FileReceiver() = default;

    /// Files on their way. Letting this go gives them up.
    class Arrival {
    public:
        virtual ~Arrival() = default;

        /// Readable when take() has something to give. Stays open as long as this lives.
        virtual int descriptor() const = 0;

        struct Outcome {
            bool isTaken = false; ///< otherwise it is not known what became of the bytes
            std::vector<ReceivedFile> files;
        };

        /// What came, once. None as long as nothing is known yet.
        virtual std::optional<Outcome> take() = 0;
    };

    /// Takes the next `bytes` bytes out of the socket, and the files among them. Nothing else may read it
    /// until they are there, or given up. Null when that is not possible.
    virtual std::unique_ptr<Arrival> receive(int socket, std::size_t bytes) = 0;

    /// Takes away what files are left in a socket that the caller is about to close.
    virtual void drop(int socket) = 0;
};

} // namespace tarn
