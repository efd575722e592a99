#include "bench/proto/Mix.h"

#include <algorithm>
#include <functional>
#include <random>
#include <string>

#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/Envelope.h"
#include "proto/ErrorUserInfo.h"
#include "proto/VelmoMessage.h"
#include "roles/Error.h"

namespace tarn {

namespace {

std::mt19937 generator(20); // NOLINT(bugprone-random-generator-seed): every run measures the same bytes

std::string uuid() {
    static constexpr char digits[] = "0123456789ABCDEF";
    std::string text = "xxxxxxxx-xxxx-4xxx-8xxx-xxxxxxxxxxxx";
    for (char& character : text) {
        if (character == 'x')
            character = digits[generator() % 16];
    }
    return text;
}

const std::string queuePlayerName = "main,com.example.podcasts.player";

double seconds() { return static_cast<double>(generator() % 3'600'000) / 1000; }

std::shared_ptr<VLProtoObjectMessage> object(const std::string& identifier) {
    auto message = std::make_shared<VLProtoObjectMessage>();
    message->setIdentifier(identifier);
    return message;
}

auto contained(const std::string& identifier, const std::string& containedIdentifier) {
    auto message = std::make_shared<VLProtoAudioFilePlayerUpdateContainedIdentifier>();
    message->setIdentifier(identifier);
    message->setContainedIdentifier(containedIdentifier);
    return message;
}

auto status(std::optional<std::string> identifier, bool failed) {
    auto message = std::make_shared<VLProtoAudioFilePlayerStatus>();
    message->setIdentifier(std::move(identifier));
    message->setStatus(failed ? 2 : 1);
    if (failed) {
        message->setErrorDomain("ostrel.tarnd.media");
        message->setErrorCode(-11829);
        message->setErrorDict(
            VLMakeDataFromErrorUserInfo({{localizedDescriptionKey, "Cannot open the file"}}));
    }
    return message;
}

auto rate(float value) {
    auto message = std::make_shared<VLProtoAudioFileQueuePlayerSetRate>();
    message->setIdentifier(queuePlayerName);
    message->setRate(value);
    return message;
}

auto metaData() {
    auto message = std::make_shared<VLProtoAudioFilePlayerAssetUpdateMetaData>();
    message->setIdentifier(uuid());
    message->setTitle("Episode 41: The long way round");
    message->setAlbumTitle("Walking and talking");
    message->setArtist("Various people");
    return message;
}

Data assetUpsert() {
    const auto message = metaData();
    message->setURL("file:///home/user/Podcasts/walking-and-talking/episode-41.m4a");
    message->setSandboxExtensionToken(uuid());
    return velmoMessage(message)->serialize();
}

Data assetAnswer() {
    const auto message = metaData();
    message->setDuration(seconds());
    return message->serialize();
}

Data currentTimeAnswer() {
    VLProtoAudioFilePlayerCurrentTime message;
    message.setCurrentTime(seconds());
    return message.serialize();
}

Data setCurrentTime() {
    auto message = std::make_shared<VLProtoAudioFilePlayerItemSetCurrentTime>();
    message->setIdentifier(uuid());
    message->setCurrentTime(seconds());
    return velmoMessage(message)->serialize();
}

Data setItems(unsigned count) {
    auto message = std::make_shared<VLProtoAudioFileQueuePlayerSetItems>();
    message->setIdentifier(queuePlayerName);
    for (unsigned index = 0; index < count; ++index)
        message->addPlayerItemIdentifiers(uuid());
    return velmoMessage(message)->serialize();
}

struct Share {
    unsigned count;
    std::function<Data()> make;
};

std::vector<Data> made(const std::vector<Share>& shares) {
    std::vector<Data> messages;
    for (const auto& share : shares)
        std::generate_n(std::back_inserter(messages), share.count, share.make);
    std::ranges::shuffle(messages, generator);
    return messages;
}

/// Commands of the client, then events of the service.
const std::vector<Share> envelopeShares = {
    {90, assetUpsert},
    {90, [] { return velmoMessageForPlayerItemUpsertWithAsset(contained(uuid(), uuid()))->serialize(); }},
    {12, [] { return setItems(10); }},
    {70,
     [] { return velmoMessageForQueuePlayerAppendItem(contained(queuePlayerName, uuid()))->serialize(); }},
    {50, [] { return velmoMessageForAssetDestroy(object(uuid()))->serialize(); }},
    {50, [] { return velmoMessageForPlayerItemDestroy(object(uuid()))->serialize(); }},
    {70, [] { return velmoMessageForPlayerItemGetCurrentTime(object(uuid()))->serialize(); }},
    {24, setCurrentTime},
    {40, [] { return velmoMessage(rate(1))->serialize(); }},
    {10, [] { return velmoMessageForQueuePlayerAdvanceToNextItem(object(queuePlayerName))->serialize(); }},
    {90, [] { return velmoMessageForPlayerItemSetStatus(status(uuid(), false))->serialize(); }},
    {10, [] { return velmoMessageForPlayerItemSetStatus(status(uuid(), true))->serialize(); }},
    {12, [] { return velmoMessageForQueuePlayerSetStatus(status(queuePlayerName, false))->serialize(); }},
    {40, [] { return velmoMessage(rate(0))->serialize(); }},
    {40,
     [] {
         return velmoMessageForQueuePlayerSetCurrentItem(contained(queuePlayerName, uuid()))->serialize();
     }},
    {20, [] { return velmoMessageForPlayerItemNotifyDidPlayToEndTime(object(uuid()))->serialize(); }},
    {20, [] { return velmoMessageForPlayerItemNotifyTimeJumped(object(uuid()))->serialize(); }},
};

} // namespace

Mix::Mix()
    : envelopes(made(envelopeShares)),
      statuses(made({{90, [] { return status(std::nullopt, false)->serialize(); }},
                     {12, [] { return status(uuid(), false)->serialize(); }}})),
      assetMetaData(made({{90, assetAnswer}})),
      currentTimes(made({{70, currentTimeAnswer}})) {}

Data queueOfItems(unsigned count) { return setItems(count); }

} // namespace tarn
