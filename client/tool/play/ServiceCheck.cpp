#include "client/tool/play/ServiceCheck.h"

#include <cstdint>
#include <future>
#include <memory>
#include <stdexcept>

namespace tarn::tool {

namespace {

constexpr std::int64_t connectionLost = 25;
constexpr std::int64_t missingObject = 26;

bool failedWith(const client::Completion& completion, std::int64_t code) {
    return completion.outcome == client::Outcome::failed && completion.error.code == code;
}

} // namespace

void checkThatServiceAnswers(client::Client& client, std::chrono::milliseconds limit) {
    // A command that asks for nothing. The answer may come when nobody waits for it any more.
    const auto answered = std::make_shared<std::promise<void>>();
    client.connection().call({}, [answered](const client::Answer&) { answered->set_value(); });
    if (answered->get_future().wait_for(limit) != std::future_status::ready)
        throw std::runtime_error(
            "the service does not answer. Does it start? Its log may say why not, as in:\n"
            "  systemctl --user status tarnd");
}

bool wasForgotten(const client::Completion& completion) {
    return failedWith(completion, connectionLost) || failedWith(completion, missingObject);
}

bool servesNobody(client::Client& client) { return failedWith(client.currentTime("").get(), connectionLost); }

} // namespace tarn::tool
