#pragma once

#include <memory>
#include <optional>
#include <utility>

#include "roles/Data.h"
#include "roles/Error.h"

namespace tarn {

/// The way to answer one call of a client: at most once, from any thread. Letting it go unanswered is an
/// outcome too, which the client is told.
///
/// Copies answer the same call: the first answer counts, and the call is let go with the last copy. An empty
/// reply, of a call that wants no answer, takes an answer and drops it.
class Reply {
public:
    /// The call itself, as the transport knows it. It is destroyed when nobody can answer it any more; by the
    /// calls that live the transport knows how far a client is ahead, and when to stop reading from it.
    class Call {
    public:
        virtual ~Call() = default;

        /// A second answer is ignored.
        virtual void answer(std::optional<Data> data, const std::optional<Error>& error) = 0;
    };

    Reply() = default;
    explicit Reply(std::shared_ptr<Call> call) : call_(std::move(call)) {}

    /// Answers with a serialized payload.
    void data(Data payload) { answer(std::move(payload), std::nullopt); }

    void error(const Error& error) { answer(std::nullopt, error); }

    /// Answers with neither data nor error.
    void nothing() { answer(std::nullopt, std::nullopt); }

    explicit operator bool() const { return call_ != nullptr; }

private:
    void answer(std::optional<Data> data, const std::optional<Error>& error) {
        if (const auto call = std::exchange(call_, nullptr))
            call->answer(std::move(data), error);
    }

    std::shared_ptr<Call> call_;
};

} // namespace tarn
