#include "tests/schedules/OrderChecks.h"

#include <algorithm>
#include <optional>
#include <set>
#include <utility>

#include "proto/VelmoMessage.h"

namespace tarn {

namespace {

constexpr std::int64_t playbackError = 24;
constexpr std::int64_t connectionLost = 25;
constexpr std::int64_t unknownIdentifier = 26;

/// Which answers a command may have; a release is one of them only when it may go unanswered.
struct Rule {
    std::string_view name;
    bool data;
    bool released;
    bool nothing;
    std::set<std::int64_t> errors;
};

/// What is known of a command beforehand.
struct Expectation {
    const Rule* rule;
    bool onItemQueue = false;
    std::string identifier;                      // one that is left out travels as an empty one
    std::vector<std::string_view> reportsBefore; // pushed before the data, in this order
};

const Rule assetUpsert{"asset upsert", true, false, true, {playbackError, unknownIdentifier}};
const Rule objectUpsert{"upsert", true, false, false, {unknownIdentifier}};
const Rule query{"query", true, false, false, {unknownIdentifier}};
const Rule edit{"edit", false, true, false, {unknownIdentifier}};
const Rule unanswered{"command without an answer", false, true, false, {}};

Expectation expectationOf(const VLProtoAudioFilePlayerItem& item) {
    if (item.hasUpsertWithAsset())
        return {&objectUpsert, true, item.upsertWithAsset()->identifier().value_or(""), {"item status"}};
    if (item.hasGetCurrentTime())
        return {&query, true, {}, {}};
    return {item.hasSetItemCurrentTime() ? &edit : &unanswered, true, {}, {}};
}

Expectation expectationOf(const VLProtoAudioFileQueuePlayer& player) {
    if (player.hasUpsertWithItems())
        return {&objectUpsert,
                false,
                player.upsertWithItems()->identifier().value_or(""),
                {"player status", "player rate", "player current item"}};
    bool namesItem = player.hasAppendItem() || player.hasRemoveItem() || player.hasReplaceCurrentItem();
    return {namesItem ? &edit : &unanswered, false, {}, {}};
}

Expectation expectationOf(const VLProtoAudioFilePlayerMessage& message) {
    if (message.hasQueuePlayer())
        return expectationOf(*message.queuePlayer());
    if (message.hasPlayerItem())
        return expectationOf(*message.playerItem());
    return {message.asset()->hasUpsertWithMetaData() ? &assetUpsert : &unanswered, false, {}, {}};
}

/// A pushed status, rate or current item, and of which object.
struct Report {
    std::string_view kind;
    commands::Identifier identifier;
};

std::optional<Report> reportOf(const SimulatedDelivery& delivery) {
    auto envelope = VLProtoVelmoMessage::fromData(delivery.data.value());
    if (!envelope || !envelope->hasAudioFilePlayerMessage())
        return std::nullopt;
    const VLProtoAudioFilePlayerMessage& message = *envelope->audioFilePlayerMessage();
    if (auto item = message.playerItem(); item && item->hasSetStatus())
        return Report{"item status", item->setStatus()->identifier()};
    if (auto player = message.queuePlayer()) {
        if (player->hasSetStatus())
            return Report{"player status", player->setStatus()->identifier()};
        if (player->hasSetRate())
            return Report{"player rate", player->setRate()->identifier()};
        if (player->hasSetCurrentItem())
            return Report{"player current item", player->setCurrentItem()->identifier()};
    }
    return Report{};
}

} // namespace

/// One walk through the deliveries.
class OrderChecks::Review {
public:
    Review(const OrderChecks& checks, const std::vector<SimulatedDelivery>& deliveries)
        : checks_(checks), deliveries_(deliveries) {}

    std::vector<std::string> run() {
        for (place_ = 0; place_ < deliveries_.size(); ++place_) {
            const SimulatedDelivery& delivery = deliveries_[place_];
            if (delivery.kind == SimulatedDelivery::Kind::event)
                require(reportOf(delivery).has_value(), "an event that cannot be decoded");
            else
                reviewOutcome(delivery);
        }
        if (checks_.replacedFrom_ > deliveries_.size())
            for (const auto& [call, known] : checks_.calls_)
                require(finished_.contains(call), "call " + std::to_string(call) + " never ended");
        return std::move(violations_);
    }

private:
    void reviewOutcome(const SimulatedDelivery& delivery) {
        auto found = checks_.calls_.find(delivery.call);
        std::string name = "call " + std::to_string(delivery.call);
        if (!require(found != checks_.calls_.end(), name + " was never sent"))
            return;
        const Expectation expected = expectationOf(*found->second.command);
        name += " (" + std::string(expected.rule->name) + ')';
        require(finished_.insert(delivery.call).second, name + " ended twice");
        bool isCancelled = delivery.error && delivery.error->code == connectionLost;
        if (isCancelled)
            require(place_ >= checks_.replacedFrom_, name + " was cancelled on a current connection");
        else
            require(isAllowed(*expected.rule, delivery), name + " has an outcome that it cannot have");
        if (delivery.kind == SimulatedDelivery::Kind::answer && !isCancelled)
            reviewAnswer(name, delivery, expected, found->second.deliveriesBefore);
    }

    static bool isAllowed(const Rule& rule, const SimulatedDelivery& delivery) {
        if (delivery.kind == SimulatedDelivery::Kind::released)
            return rule.released;
        if (delivery.error)
            return rule.errors.contains(delivery.error->code);
        return delivery.data ? rule.data : rule.nothing;
    }

    void reviewAnswer(const std::string& name, const SimulatedDelivery& delivery, const Expectation& expected,
                      std::size_t deliveriesBefore) {
        std::uint64_t& last = lastAnswered_[expected.onItemQueue];
        require(delivery.call > last, name + " was answered after call " + std::to_string(last));
        last = std::max(last, delivery.call);
        if (delivery.data && place_ < checks_.replacedFrom_)
            require(reportsCame(expected, deliveriesBefore), name + " was answered before its reports");
    }

    bool reportsCame(const Expectation& expected, std::size_t deliveriesBefore) const {
        auto awaited = expected.reportsBefore.begin();
        for (std::size_t place = deliveriesBefore; place < place_ && awaited != expected.reportsBefore.end();
             ++place) {
            if (deliveries_[place].kind != SimulatedDelivery::Kind::event)
                continue;
            auto report = reportOf(deliveries_[place]);
            if (report && report->kind == *awaited && report->identifier == expected.identifier)
                ++awaited;
        }
        return awaited == expected.reportsBefore.end();
    }

    bool require(bool holds, const std::string& otherwise) {
        if (!holds)
            violations_.push_back("delivery " + std::to_string(place_) + ": " + otherwise);
        return holds;
    }

    const OrderChecks& checks_;
    const std::vector<SimulatedDelivery>& deliveries_;
    std::size_t place_ = 0;
    std::set<std::uint64_t> finished_;
    std::uint64_t lastAnswered_[2] = {0, 0}; // on the queue-player queue and on the player-item queue
    std::vector<std::string> violations_;
};

void OrderChecks::sent(std::uint64_t call, const commands::Command& command, std::size_t deliveriesBefore) {
    calls_.emplace(call, Call{command, deliveriesBefore});
}

void OrderChecks::mayBeReplacedFrom(std::size_t delivery) {
    replacedFrom_ = std::min(replacedFrom_, delivery);
}

std::vector<std::string> OrderChecks::violations(const std::vector<SimulatedDelivery>& deliveries) const {
    return Review(*this, deliveries).run();
}

} // namespace tarn
