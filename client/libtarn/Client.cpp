#include "tarn/Client.h"

#include <fcntl.h>
#include <sys/random.h>

#include <array>
#include <cerrno>
#include <filesystem>
#include <system_error>
#include <utility>

#include "client/libtarn/Decoding.h"
#include "client/libtarn/EventQueue.h"
#include "proto/Envelope.h"
#include "proto/VelmoMessage.h"
#include "system/FileDescriptor.h"

namespace tarn::client {

namespace {

constexpr std::string_view hexadecimalDigits = "0123456789ABCDEF";

std::string absolutePath(const std::string& path) {
    return std::filesystem::absolute(path).lexically_normal().string();
}

std::string makeToken() {
    std::array<unsigned char, 16> random{};
    if (::getrandom(random.data(), random.size(), 0) != static_cast<ssize_t>(random.size()))
        throw std::system_error(errno, std::generic_category(), "getrandom");
    std::string token;
    for (const unsigned byte : random)
        token.append({hexadecimalDigits[byte >> 4U], hexadecimalDigits[byte & 0xFU]});
    return token;
}

std::shared_ptr<VLProtoObjectMessage> object(const std::string& identifier) {
    auto message = std::make_shared<VLProtoObjectMessage>();
    message->setIdentifier(identifier);
    return message;
}

std::shared_ptr<VLProtoAudioFilePlayerUpdateContainedIdentifier> pair(const std::string& identifier,
                                                                      const std::string& contained) {
    auto message = std::make_shared<VLProtoAudioFilePlayerUpdateContainedIdentifier>();
    message->setIdentifier(identifier);
    message->setContainedIdentifier(contained);
    return message;
}

} // namespace

std::string fileURL(const std::string& path) {
    constexpr std::string_view plain = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-._~/";
    std::string URL = "file://";
    for (const char character : absolutePath(path)) {
        const auto byte = static_cast<unsigned char>(character);
        if (plain.find(character) != std::string_view::npos)
            URL += character;
        else
            URL.append({'%', hexadecimalDigits[byte >> 4U], hexadecimalDigits[byte & 0xFU]});
    }
    return URL;
}

class [[gnu::visibility("hidden")]] Client::Implementation {
public:
    explicit Implementation(Options options)
        : onEvent_(std::move(options.onEvent)),
          connection_(
              {[this](const Bytes& envelope) { receive(envelope); }, [this] { report(ConnectionLost{}); }},
              std::move(options.socketPath)) {}

    std::future<Completion> perform(const Envelope& envelope) {
        auto promise = std::make_shared<std::promise<Completion>>();
        auto future = promise->get_future();
        connection_.call(envelope->serialize(), [promise](Answer answer) {
            promise->set_value({answer.outcome, std::move(answer.error)});
        });
        return future;
    }

    template <class Value>
    std::future<Result<Value>> ask(const Envelope& envelope, std::optional<Value> (*decode)(const Bytes&)) {
        auto promise = std::make_shared<std::promise<Result<Value>>>();
        auto future = promise->get_future();
        connection_.call(envelope->serialize(), [promise, decode](Answer answer) {
            Result<Value> result{{answer.outcome, std::move(answer.error)}, {}};
            if (answer.data)
                result.value = decode(*answer.data).value_or(Value());
            promise->set_value(std::move(result));
        });
        return future;
    }

    void reconnect() {
        connection_.disconnect(); // from here on no more events come of it
        events_.begin();
        try {
            connection_.reconnect();
        } catch (...) {
            events_.end();
            throw;
        }
    }

    EventQueue& events() { return events_; }
    Connection& connection() { return connection_; }

private:
    void receive(const Bytes& envelope) {
        if (auto event = decodeEvent(envelope))
            report(std::move(*event));
    }

    void report(Event event) {
        if (onEvent_)
            onEvent_(event);
        else
            events_.push(std::move(event));
    }

    const std::function<void(const Event&)> onEvent_;
    EventQueue events_;
    Connection connection_; // goes first: its thread uses the rest
};

Client::Client() : Client(Options()) {}

Client::Client(Options options) : implementation_(std::make_unique<Implementation>(std::move(options))) {}

Client::~Client() = default;

std::future<Result<AssetInfo>> Client::upsertAsset(const AssetUpsert& asset) {
    auto message = std::make_shared<VLProtoAudioFilePlayerAssetUpdateMetaData>();
    message->setIdentifier(asset.identifier);
    message->setURL(asset.URL);
    message->setTitle(asset.title);
    message->setAlbumTitle(asset.albumTitle);
    message->setArtist(asset.artist);
    message->setSandboxExtensionToken(asset.sandboxExtensionToken);
    return implementation_->ask(velmoMessage(std::move(message)), decodeAssetInfo);
}

std::future<Completion> Client::destroyAsset(const std::string& asset) {
    return implementation_->perform(velmoMessageForAssetDestroy(object(asset)));
}

std::future<Result<Status>> Client::upsertItem(const std::string& item, const std::string& asset) {
    return implementation_->ask(velmoMessageForPlayerItemUpsertWithAsset(pair(item, asset)), decodeStatus);
}

std::future<Completion> Client::destroyItem(const std::string& item) {
    return implementation_->perform(velmoMessageForPlayerItemDestroy(object(item)));
}

std::future<Result<double>> Client::currentTime(const std::string& item) {
    return implementation_->ask(velmoMessageForPlayerItemGetCurrentTime(object(item)), decodeCurrentTime);
}

std::future<Completion> Client::setCurrentTime(const std::string& item, double seconds) {
    auto message = std::make_shared<VLProtoAudioFilePlayerItemSetCurrentTime>();
    message->setIdentifier(item);
    message->setCurrentTime(seconds);
    return implementation_->perform(velmoMessage(std::move(message)));
}

std::future<Result<Status>> Client::upsertQueuePlayer(const std::string& player,
                                                      const std::vector<std::string>& items) {
    auto message = std::make_shared<VLProtoAudioFileQueuePlayerSetItems>();
    message->setIdentifier(player);
    for (const auto& item : items)
        message->addPlayerItemIdentifiers(item);
    return implementation_->ask(velmoMessage(std::move(message)), decodeStatus);
}

std::future<Completion> Client::destroyQueuePlayer(const std::string& player) {
    return implementation_->perform(velmoMessageForQueuePlayerDestroy(object(player)));
}

std::future<Completion> Client::setRate(const std::string& player, float rate) {
    auto message = std::make_shared<VLProtoAudioFileQueuePlayerSetRate>();
    message->setIdentifier(player);
    message->setRate(rate);
    return implementation_->perform(velmoMessage(std::move(message)));
}

std::future<Completion> Client::advanceToNextItem(const std::string& player) {
    return implementation_->perform(velmoMessageForQueuePlayerAdvanceToNextItem(object(player)));
}

std::future<Completion> Client::appendItem(const std::string& player, const std::string& item) {
    return implementation_->perform(velmoMessageForQueuePlayerAppendItem(pair(player, item)));
}

std::future<Completion> Client::removeItem(const std::string& player, const std::string& item) {
    return implementation_->perform(velmoMessageForQueuePlayerRemoveItem(pair(player, item)));
}

std::future<Completion> Client::removeAllItems(const std::string& player) {
    return implementation_->perform(velmoMessageForQueuePlayerRemoveAllItems(object(player)));
}

std::future<Completion> Client::replaceCurrentItem(const std::string& player, const std::string& item) {
    return implementation_->perform(velmoMessageForQueuePlayerReplaceCurrentItem(pair(player, item)));
}

std::string Client::grantFile(const std::string& path) {
    const auto absolute = absolutePath(path);
    const FileDescriptor file(::open(absolute.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    if (!file)
        throw std::system_error(errno, std::generic_category(), absolute);
    auto token = makeToken();
    connection().grant(token, absolute, file.get());
    return token;
}

std::optional<Event> Client::nextEvent(std::chrono::milliseconds limit) {
    return implementation_->events().pop(std::chrono::steady_clock::now() + limit);
}

std::optional<Event> Client::nextEvent() { return implementation_->events().pop(std::nullopt); }

void Client::reconnect() { implementation_->reconnect(); }

Connection& Client::connection() { return implementation_->connection(); }

} // namespace tarn::client
