#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <thread>

#include "objects/ObjectRegistry.h"

namespace tarn {
namespace {

/// Stands for a media object, and calls back when it is destroyed.
struct Entry {
    Entry(const void* mediaObject, std::function<void()> block)
        : media(mediaObject), whenDestroyed(std::move(block)) {}
    ~Entry() {
        if (whenDestroyed)
            whenDestroyed();
    }
    const void* mediaObject() const { return media; }

    const void* const media;
    const std::function<void()> whenDestroyed;
};

std::shared_ptr<Entry> entry(const void* media, std::function<void()> whenDestroyed = nullptr) {
    return std::make_shared<Entry>(media, std::move(whenDestroyed));
}

const int media[3] = {};

TEST(ObjectRegistryTest, FindsAnObjectByItsIdentifierAndByWhatItStandsFor) {
    ObjectRegistry<Entry> registry;
    auto first = entry(&media[0]);
    auto second = entry(&media[1]);
    registry.setObject("first", first);
    registry.setObject("", second);

    EXPECT_EQ(registry.objectWithIdentifier("first"), first);
    EXPECT_EQ(registry.objectWithIdentifier(""), second);
    EXPECT_EQ(registry.objectWithIdentifier("third"), nullptr);
    EXPECT_EQ(registry.objectWithIdentifier(std::nullopt), nullptr);
    EXPECT_EQ(registry.objectForMediaObject(&media[0]), first);
    EXPECT_EQ(registry.identifierForMediaObject(&media[1]), "");
    EXPECT_EQ(registry.identifierForMediaObject(&media[2]), std::nullopt);
    EXPECT_EQ(registry.objectForMediaObject(nullptr), nullptr);
}

TEST(ObjectRegistryTest, ForgetsWhatAReplacedOrRemovedObjectStoodFor) {
    ObjectRegistry<Entry> registry;
    registry.setObject("a", entry(&media[0]));
    registry.setObject("a", entry(&media[1]));
    EXPECT_EQ(registry.identifierForMediaObject(&media[0]), std::nullopt);
    EXPECT_EQ(registry.identifierForMediaObject(&media[1]), "a");

    // A record that is updated stands for the same media object as before.
    auto updated = entry(&media[1]);
    registry.setObject("a", updated);
    EXPECT_EQ(registry.objectForMediaObject(&media[1]), updated);

    registry.removeObject("unknown");
    registry.removeObject("a");
    EXPECT_EQ(registry.identifierForMediaObject(&media[1]), std::nullopt);
    EXPECT_EQ(registry.objectWithIdentifier("a"), nullptr);
}

TEST(ObjectRegistryTest, KeepsNothingOnceItIsClosed) {
    ObjectRegistry<Entry> registry;
    std::optional<std::string> seen = "unseen";
    registry.setObject("a", entry(&media[0], [&] { seen = registry.identifierForMediaObject(&media[0]); }));
    registry.close();
    EXPECT_EQ(seen, std::nullopt);
    registry.setObject("b", entry(&media[1]));
    EXPECT_EQ(registry.objectWithIdentifier("a"), nullptr);
    EXPECT_EQ(registry.objectWithIdentifier("b"), nullptr);
    EXPECT_EQ(registry.identifierForMediaObject(&media[0]), std::nullopt);
    EXPECT_EQ(registry.identifierForMediaObject(&media[1]), std::nullopt);
}

TEST(ObjectRegistryTest, AnswersReadersWhileItChanges) {
    constexpr int count = 64;
    constexpr int rounds = 50;
    static const int objects[count] = {};
    ObjectRegistry<Entry> registry;
    std::atomic<bool> finished = false;
    std::atomic<int> wrong = 0;
    auto read = [&] {
        for (int index = 0; !finished; index = (index + 1) % count) {
            const int* object = &objects[index];
            auto found = registry.objectWithIdentifier(std::to_string(index));
            auto identifier = registry.identifierForMediaObject(object);
            wrong +=
                (found && found->media != object) || (identifier && *identifier != std::to_string(index));
        }
    };
    std::jthread first(read);
    std::jthread second(read);
    for (int round = 0; round < rounds; ++round) {
        for (int index = 0; index < count; ++index)
            registry.setObject(std::to_string(index), entry(&objects[index], [&, index] {
                                   (void)registry.identifierForMediaObject(&objects[index]);
                               }));
        for (int index = round % 2; index < count; index += 2)
            registry.removeObject(std::to_string(index));
    }
    finished = true;
    first.join();
    second.join();
    EXPECT_EQ(wrong, 0);
}

} // namespace
} // namespace tarn
