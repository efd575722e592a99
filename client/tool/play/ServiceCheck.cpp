#include "client/tool/play/ServiceCheck.h"

#include <future>
#include <memory>
#include <stdexcept>

namespace tarn::tool {

void checkThatServiceAnswers(client::Client& client, std::chrono::milliseconds limit) {
    // A command that asks for nothing. The answer may come when nobody waits for it any more.
    const auto answered = std::make_shared<std::promise<void>>();
    client.connection().call({}, [answered](const client::Answer&) { answered->set_value(); });
    if (answered->get_future().wait_for(limit) != std::future_status::ready)
        throw std::runtime_error(
            "the service does not answer. Does it start? Its log may say why not, as in:\n"
            "  systemctl --user status tarnd");
}

} // namespace tarn::tool
