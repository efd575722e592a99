#include "roles/Work.h"

#include <gtest/gtest.h>

#include <array>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "wire/BlockCache.h"

namespace tarn {
namespace {

template <std::size_t padding>
Work workOfSize(std::shared_ptr<std::string> transcript) {
    return
        [transcript = std::move(transcript), alone = std::make_unique<int>(7),
         filler = std::array<char, padding>{}] { *transcript += std::to_string(*alone + filler[0]) + " "; };
}

TEST(Work, RunsAndLetsGoWhatItHoldsWhetherThatFitsInsideOrNot) {
    const auto transcript = std::make_shared<std::string>();
    {
        std::vector<Work> works;
        for (int i = 0; i < 20; ++i) { // the vector grows, so that they move
            works.push_back(workOfSize<1>(transcript));
            works.push_back(workOfSize<200>(transcript));
        }
        EXPECT_EQ(transcript.use_count(), 41);
        for (auto& work : works)
            work();
        works[0] = nullptr;
        works[1] = std::move(works[2]);
        EXPECT_FALSE(works[0]);
        EXPECT_FALSE(works[2]);
        EXPECT_EQ(transcript.use_count(), 39);
        works[1]();
    }
    std::string expected;
    for (int i = 0; i < 41; ++i)
        expected += "7 ";
    EXPECT_EQ(*transcript, expected);
    EXPECT_EQ(transcript.use_count(), 1);
}

TEST(Work, MayHoldTheLastOwnerOfItself) {
    struct Owner {
        Work work;
    };
    auto owner = std::make_shared<Owner>();
    const std::weak_ptr<Owner> watched = owner;
    auto& work = owner->work;
    work = [owner = std::move(owner)] {};
    work = nullptr;
    EXPECT_TRUE(watched.expired());
}

TEST(BlockCache, LendsABlockToOneObjectAtATimeWhicheverThreadLetsItGo) {
    struct Object {
        std::size_t number;
        std::size_t copy;
    };
    std::vector<std::shared_ptr<Object>> objects;
    std::size_t next = 0;
    for (int round = 0; round < 50; ++round) {
        while (objects.size() < 500) {
            const auto number = next++;
            objects.push_back(makeCached<Object>(Object{number, number}));
        }
        std::thread([&] { // ends with blocks of its own, which must not be lost to others in use
            objects.erase(objects.begin() + round, objects.begin() + 300 + round);
            objects.push_back(makeCached<Object>(Object{next, next}));
            ++next;
        })
            .join();
        for (std::size_t i = 0; i < objects.size(); ++i) {
            ASSERT_EQ(objects[i]->number, objects[i]->copy);
            for (std::size_t k = i + 1; k < objects.size(); ++k)
                ASSERT_NE(objects[i]->number, objects[k]->number);
        }
    }
}

} // namespace
} // namespace tarn
