#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <string>

#include "reply/EventSink.h"
#include "roles/Reply.h"
#include "wire/Dictionary.h"
#include "wire/ProtoCodable.h"

namespace tarn {

/// What a client sees, one line each, in the order in which it happens:
///
///     push playerItem.setStatus identifier=song status=1
///     upsertWithAsset: status=1
///     getCurrentTime: error 26
///     upsertWithMetaData: error 24 because: There is no such file.
///     destroy: no answer
///
/// Any thread may call.
class Transcript final : public EventSink, public std::enable_shared_from_this<Transcript> {
public:
    void sendData(const Data& data) override;

    /// A reply whose outcome becomes a line that begins with `command`; its data is read as a `Payload`.
    template <class Payload>
    Reply reply(const std::string& command) {
        return makeReply(command, [](const Data& data) -> std::shared_ptr<ProtoCodable> {
            return Payload::fromData(data);
        });
    }

    /// Runs `act` once, inside the next push whose line holds `text`, on its thread.
    void whenPushed(std::string text, std::function<void()> act);

    void add(const std::string& line);

    /// The lines since the last call, each with a line end.
    std::string take();

private:
    using Decode = std::function<std::shared_ptr<ProtoCodable>(const Data&)>;

    Reply makeReply(const std::string& command, Decode decode);

    std::function<void()> actFor(const std::string& line);

    std::mutex mutex_;
    std::string lines_;
    std::string awaited_;
    std::function<void()> act_; // null when nothing is awaited
};

/// `a.b x=1 y=text`: the names on the way down while there is only one, then the values.
std::string oneLine(const Dictionary& dictionary);

} // namespace tarn
