#include <gmock/gmock.h>

#include <functional>

#include "tests/support/ClientStory.h"

namespace tarn {
namespace {

using namespace commands;

/// A command by its identifier, and how it ends when the identifier is left out and when it is one that no
/// object has.
struct BadInput {
    const char* name;
    std::function<Command(const Identifier&)> make;
    const char* leftOut;
    const char* unknown;
};

const BadInput badInputs[] = {
    {"upsertAsset",
     [](const Identifier& identifier) { return upsertAsset({.identifier = identifier, .URL = "file:///a"}); },
     "error 26", "duration=10 identifier=* title=a"},
    {"destroyAsset", destroyAsset, "no answer", "no answer"},
    {"upsertItem", [](const Identifier& identifier) { return upsertItem(identifier, "a"); }, "error 26",
     "status=0"},
    {"destroyItem", destroyItem, "no answer", "no answer"},
    {"getCurrentTime", getCurrentTime, "error 26", "error 26"},
    {"setCurrentTime", [](const Identifier& identifier) { return setCurrentTime(identifier, 1); }, "error 26",
     "error 26"},
    {"upsertPlayer", [](const Identifier& identifier) { return upsertPlayer(identifier, {"a"}); }, "error 26",
     "identifier=a status=1"},
    {"destroyPlayer", destroyPlayer, "no answer", "no answer"},
    {"setRate", [](const Identifier& identifier) { return setRate(identifier, 1); }, "no answer",
     "no answer"},
    {"replaceCurrentItem", [](const Identifier& identifier) { return replaceCurrentItem(identifier, "a"); },
     "no answer", "no answer"},
    {"advanceToNextItem", advanceToNextItem, "no answer", "no answer"},
    {"appendItem", [](const Identifier& identifier) { return appendItem(identifier, "a"); }, "no answer",
     "no answer"},
    {"removeItem", [](const Identifier& identifier) { return removeItem(identifier, "a"); }, "no answer",
     "no answer"},
    {"removeAllItems", removeAllItems, "no answer", "no answer"},
};

class BadInputTest : public ClientStory, public testing::WithParamInterface<BadInput> {
protected:
    BadInputTest() { mirror({"a"}); }

    /// How the command ended; long identifiers stand as a star.
    std::string outcome(const Identifier& identifier) {
        std::string seen = tell(GetParam().make(identifier));
        seen.pop_back();
        seen.erase(0, seen.rfind('\n') + 1);
        seen.erase(0, seen.find(": ") + 2);
        std::string name = "identifier=" + identifier.value_or("*") + " title";
        if (auto place = seen.find(name); place != std::string::npos)
            seen.replace(place, name.size(), "identifier=* title");
        return seen;
    }
};

TEST_P(BadInputTest, AnIdentifierThatIsLeftOutIsLoggedOnceAndStoresNothing) {
    EXPECT_EQ(outcome(std::nullopt), GetParam().leftOut);
    EXPECT_EQ(errors().size(), 1u);
}

TEST_P(BadInputTest, AnEmptyOrVeryLongIdentifierIsOneLikeAnyOther) {
    for (const std::string& identifier : {std::string(), std::string(1 << 20, 'x')})
        EXPECT_EQ(outcome(identifier), GetParam().unknown);
    std::size_t lines = std::string_view(GetParam().unknown) == "error 26" ? 2 : 0;
    EXPECT_EQ(errors().size(), lines);
}

INSTANTIATE_TEST_SUITE_P(EveryCommand, BadInputTest, testing::ValuesIn(badInputs),
                         [](const auto& input) { return std::string(input.param.name); });

} // namespace
} // namespace tarn
