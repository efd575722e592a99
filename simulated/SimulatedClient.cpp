#include "simulated/SimulatedClient.h"

#include <utility>

namespace tarn {

namespace {

std::string outcomeOf(const SimulatedDelivery& delivery,
                      const std::function<std::string(const Data&)>& describe) {
    if (delivery.kind == SimulatedDelivery::Kind::released)
        return "released";
    if (delivery.error)
        return "error " + std::to_string(delivery.error->code);
    if (delivery.data)
        return "data " + describe(*delivery.data);
    return "nothing";
}

} // namespace

std::uint64_t SimulatedClient::call(Data data) {
    connection_->call(++lastCall_, std::move(data));
    return lastCall_;
}

std::vector<std::string>
SimulatedClient::transcript(const std::function<std::string(const Data&)>& describe) const {
    std::vector<std::string> lines;
    for (const auto& delivery : connection_->deliveries()) {
        if (delivery.kind == Kind::event)
            lines.push_back("event " + describe(*delivery.data));
        else
            lines.push_back(std::to_string(delivery.call) + ": " + outcomeOf(delivery, describe));
    }
    return lines;
}

std::vector<std::string> SimulatedClient::outcomes(std::uint64_t call) const {
    std::vector<std::string> outcomes;
    for (const auto& delivery : connection_->deliveries())
        if (delivery.kind != Kind::event && delivery.call == call)
            outcomes.push_back(outcomeOf(delivery, hex));
    return outcomes;
}

std::string SimulatedClient::outcome(std::uint64_t call) const {
    auto all = outcomes(call);
    return all.size() == 1 ? all.front() : "";
}

std::string SimulatedClient::hex(const Data& data) {
    constexpr char digits[] = "0123456789abcdef";
    std::string text;
    for (auto byte : data) {
        text += digits[byte >> 4];
        text += digits[byte & 15];
    }
    return text;
}

} // namespace tarn
