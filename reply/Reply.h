#pragma once

#include <memory>
#include <optional>
#include <utility>

#include "roles/Data.h"
#include "roles/Error.h"
#include "roles/ServiceConnection.h"

namespace tarn {

/// The way to answer one command: at most once, from any thread. Letting it go unanswered is an outcome too.
///
/// An empty reply (the client wants no answer) takes an answer and drops it.
class Reply {
public:
    Reply() = default;
    explicit Reply(std::unique_ptr<ClientCallback> callback) : callback_(std::move(callback)) {}

    /// Answers with a serialized payload.
    void data(Data payload) { answer(std::move(payload), std::nullopt); }

    void error(const Error& error) { answer(std::nullopt, error); }

    /// Answers with neither data nor error.
    void nothing() { answer(std::nullopt, std::nullopt); }

    explicit operator bool() const { return callback_ != nullptr; }

private:
    void answer(std::optional<Data> data, const std::optional<Error>& error) {
        if (auto callback = std::exchange(callback_, nullptr))
            callback->call(std::move(data), error);
    }

    std::unique_ptr<ClientCallback> callback_;
};

} // namespace tarn
