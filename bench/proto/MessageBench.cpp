// Decoding, encoding, copying and comparing messages, beside libprotobuf's full C++ classes.

#include <cstdio>
#include <thread>

#include <benchmark/benchmark.h>

#include "bench/proto/Mix.h"
#include "bench/support/Comparison.h"
#include "proto/AudioFilePlayerAssetUpdateMetaData.h"
#include "proto/AudioFilePlayerCurrentTime.h"
#include "proto/AudioFilePlayerStatus.h"
#include "proto/VelmoMessage.h"
#include "velmo.pb.h"

namespace tarn {

namespace {

/// Our messages, as the service and the client library use them.
struct Tarn {
    template <class Message>
    using Held = std::shared_ptr<Message>;

    using Envelope = VLProtoVelmoMessage;
    using Status = VLProtoAudioFilePlayerStatus;
    using MetaData = VLProtoAudioFilePlayerAssetUpdateMetaData;
    using CurrentTime = VLProtoAudioFilePlayerCurrentTime;

    template <class Message>
    static Held<Message> decode(const Data& bytes) {
        return Message::fromData(bytes);
    }
    template <class Message>
    static Data encode(const Held<Message>& message) {
        return message->serialize();
    }
    template <class Message>
    static Held<Message> copy(const Held<Message>& message) {
        return message->copyWithZone();
    }
    template <class Message>
    static bool equal(const Held<Message>& left, const Held<Message>& right) {
        return left->isEqual(*right);
    }
};

/// libprotobuf's, held on the heap where ours are.
struct Libprotobuf {
    template <class Message>
    using Held = std::unique_ptr<Message>;

    using Envelope = wire::VLProtoVelmoMessage;
    using Status = wire::VLProtoAudioFilePlayerStatus;
    using MetaData = wire::VLProtoAudioFilePlayerAssetUpdateMetaData;
    using CurrentTime = wire::VLProtoAudioFilePlayerCurrentTime;

    template <class Message>
    static Held<Message> decode(const Data& bytes) {
        auto message = std::make_unique<Message>();
        return message->ParseFromArray(bytes.data(), static_cast<int>(bytes.size())) ? std::move(message)
                                                                                     : nullptr;
    }
    template <class Message>
    static std::string encode(const Held<Message>& message) {
        return message->SerializeAsString();
    }
    template <class Message>
    static Held<Message> copy(const Held<Message>& message) {
        return std::make_unique<Message>(*message);
    }
    /// The full classes cannot compare; comparing encodings is what their users do.
    template <class Message>
    static bool equal(const Held<Message>& left, const Held<Message>& right) {
        return left->SerializeAsString() == right->SerializeAsString();
    }
};

const Mix& mix() {
    static const Mix instance;
    return instance;
}

template <class Library, class Message>
std::vector<typename Library::template Held<Message>> decodeAll(const std::vector<Data>& encoded) {
    std::vector<typename Library::template Held<Message>> messages;
    messages.reserve(encoded.size());
    for (const Data& bytes : encoded)
        messages.push_back(Library::template decode<Message>(bytes));
    return messages;
}

/// The decoded mix.
template <class Library>
struct Messages {
    std::vector<typename Library::template Held<typename Library::Envelope>> envelopes;
    std::vector<typename Library::template Held<typename Library::Status>> statuses;
    std::vector<typename Library::template Held<typename Library::MetaData>> assetMetaData;
    std::vector<typename Library::template Held<typename Library::CurrentTime>> currentTimes;

    Messages()
        : envelopes(decodeAll<Library, typename Library::Envelope>(mix().envelopes)),
          statuses(decodeAll<Library, typename Library::Status>(mix().statuses)),
          assetMetaData(decodeAll<Library, typename Library::MetaData>(mix().assetMetaData)),
          currentTimes(decodeAll<Library, typename Library::CurrentTime>(mix().currentTimes)) {}

    std::size_t size() const {
        return envelopes.size() + statuses.size() + assetMetaData.size() + currentTimes.size();
    }

    /// `visit(message, same message decoded once more)` for each.
    template <class Visitor>
    void forEachPair(const Messages& twin, Visitor visit) const {
        const auto each = [&visit](const auto& ours, const auto& theirs) {
            for (std::size_t index = 0; index < ours.size(); ++index)
                visit(ours[index], theirs[index]);
        };
        each(envelopes, twin.envelopes);
        each(statuses, twin.statuses);
        each(assetMetaData, twin.assetMetaData);
        each(currentTimes, twin.currentTimes);
    }
};

template <class Library, class Message>
void decodeEach(const std::vector<Data>& encoded) {
    for (const Data& bytes : encoded) {
        auto message = Library::template decode<Message>(bytes);
        benchmark::DoNotOptimize(message);
    }
}

template <class Library>
void decode(benchmark::State& state) {
    for ([[maybe_unused]] auto round : state) {
        decodeEach<Library, typename Library::Envelope>(mix().envelopes);
        decodeEach<Library, typename Library::Status>(mix().statuses);
        decodeEach<Library, typename Library::MetaData>(mix().assetMetaData);
        decodeEach<Library, typename Library::CurrentTime>(mix().currentTimes);
    }
}

template <class Library>
void encode(benchmark::State& state) {
    const Messages<Library> messages;
    for ([[maybe_unused]] auto round : state) {
        messages.forEachPair(messages, [](const auto& message, const auto&) {
            auto bytes = Library::encode(message);
            benchmark::DoNotOptimize(bytes);
        });
    }
}

template <class Library>
void copy(benchmark::State& state) {
    const Messages<Library> messages;
    for ([[maybe_unused]] auto round : state) {
        messages.forEachPair(messages, [](const auto& message, const auto&) {
            auto copied = Library::copy(message);
            benchmark::DoNotOptimize(copied);
        });
    }
}

template <class Library>
void equality(benchmark::State& state) {
    const Messages<Library> messages;
    const Messages<Library> twin;
    for ([[maybe_unused]] auto round : state) {
        bool same = true;
        messages.forEachPair(twin, [&same](const auto& message, const auto& other) {
            same &= Library::equal(message, other);
        });
        if (!same)
            state.SkipWithError("equal messages compare unequal");
    }
}

template <class Library>
void decodeList(benchmark::State& state) {
    const Data bytes = queueOfItems(1000);
    for ([[maybe_unused]] auto round : state) {
        auto message = Library::template decode<typename Library::Envelope>(bytes);
        benchmark::DoNotOptimize(message);
    }
}

template <class Library>
void registerAll(const std::string& side) {
    benchmark::RegisterBenchmark(("decode/" + side).c_str(), decode<Library>);
    benchmark::RegisterBenchmark(("encode/" + side).c_str(), encode<Library>);
    benchmark::RegisterBenchmark(("deep copy/" + side).c_str(), copy<Library>);
    benchmark::RegisterBenchmark(("equality/" + side).c_str(), equality<Library>);
    benchmark::RegisterBenchmark(("list of 1,000/" + side).c_str(), decodeList<Library>);
}

void describeMix() {
    std::size_t count = 0;
    std::size_t bytes = 0;
    for (const auto* messages :
         {&mix().envelopes, &mix().statuses, &mix().assetMetaData, &mix().currentTimes}) {
        count += messages->size();
        for (const Data& message : *messages)
            bytes += message.size();
    }
    std::printf("mix of %zu messages, %.1f bytes each; times are for the whole mix\n", count,
                static_cast<double>(bytes) / static_cast<double>(count));
}

constexpr Goal goals[] = {
    {"decode", 1.7}, {"encode", 1.4}, {"deep copy", 1.5}, {"equality", 5}, {"list of 1,000", 2},
};

} // namespace

} // namespace tarn

int main(int argc, char** argv) {
    // The standard library counts references without atomic operations until there is a second thread. The
    // service has several.
    std::thread([] {}).join();
    tarn::registerAll<tarn::Tarn>("tarn");
    tarn::registerAll<tarn::Libprotobuf>("libprotobuf");
    tarn::describeMix();
    return tarn::compareWithPeers(argc, argv, tarn::goals);
}
