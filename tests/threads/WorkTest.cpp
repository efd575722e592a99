#include "roles/Work.h"

#include <gtest/gtest.h>

#include <array>
#include <memory>
#include <string>

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

} // namespace
} // namespace tarn
