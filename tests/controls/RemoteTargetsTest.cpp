#include "controls/RemoteTargets.h"

#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>

namespace tarn {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class RemoteTargetsTest : public testing::Test {
protected:
    RemoteCommand::Handler answering(const std::string& name, RemoteCommandResult result) {
        return [this, name, result] {
            asked_.push_back(name);
            return result;
        };
    }

    std::vector<std::string> asked_;
    int changes_ = 0;
    RemoteTargets targets_{[this] { ++changes_; }};
};

TEST_F(RemoteTargetsTest, PauseReachesEveryTargetAndOneSuccessIsEnough) {
    const auto oldest = targets_.pauseCommand().addTarget(answering("oldest", RemoteCommandResult::success));
    const auto newest =
        targets_.pauseCommand().addTarget(answering("newest", RemoteCommandResult::commandFailed));

    EXPECT_EQ(targets_.deliver(RemoteCommandKind::pause), RemoteCommandResult::success);
    EXPECT_THAT(asked_, ElementsAre("newest", "oldest"));
}

TEST_F(RemoteTargetsTest, OtherCommandsGoToOlderTargetsUntilOneSucceeds) {
    const auto oldest = targets_.playCommand().addTarget(answering("oldest", RemoteCommandResult::success));
    const auto middle = targets_.playCommand().addTarget(answering("middle", RemoteCommandResult::success));
    const auto newest =
        targets_.playCommand().addTarget(answering("newest", RemoteCommandResult::commandFailed));

    EXPECT_EQ(targets_.deliver(RemoteCommandKind::play), RemoteCommandResult::success);
    EXPECT_THAT(asked_, ElementsAre("newest", "middle"));
}

TEST_F(RemoteTargetsTest, WithoutSuccessTheNewestTargetsResultHolds) {
    const auto oldest =
        targets_.nextTrackCommand().addTarget(answering("oldest", RemoteCommandResult::commandFailed));
    const auto newest =
        targets_.nextTrackCommand().addTarget(answering("newest", RemoteCommandResult::noSuchContent));

    EXPECT_EQ(targets_.deliver(RemoteCommandKind::nextTrack), RemoteCommandResult::noSuchContent);
    EXPECT_THAT(asked_, ElementsAre("newest", "oldest"));
}

TEST_F(RemoteTargetsTest, ADisabledCommandReachesNobody) {
    const auto target =
        targets_.previousTrackCommand().addTarget(answering("target", RemoteCommandResult::success));
    targets_.previousTrackCommand().setEnabled(false);

    EXPECT_FALSE(targets_.offers(RemoteCommandKind::previousTrack));
    EXPECT_EQ(targets_.deliver(RemoteCommandKind::previousTrack), RemoteCommandResult::noSuchContent);
    EXPECT_THAT(asked_, IsEmpty());
}

TEST_F(RemoteTargetsTest, ATargetThatGoesDuringADeliveryIsPassedOver) {
    RegistrationHandle oldest =
        targets_.pauseCommand().addTarget(answering("oldest", RemoteCommandResult::success));
    RegistrationHandle newest;
    newest = targets_.pauseCommand().addTarget([&] {
        oldest.reset();
        newest.reset(); // a target may end its own registration
        return RemoteCommandResult::commandFailed;
    });

    EXPECT_EQ(targets_.deliver(RemoteCommandKind::pause), RemoteCommandResult::commandFailed);
    EXPECT_THAT(asked_, IsEmpty());
    EXPECT_FALSE(targets_.offers(RemoteCommandKind::pause));
}

TEST_F(RemoteTargetsTest, ChangesAreToldOnlyWhenWhatIsOfferedChanges) {
    auto first = targets_.playCommand().addTarget(answering("first", RemoteCommandResult::success));
    EXPECT_EQ(changes_, 1);
    auto second = targets_.playCommand().addTarget(answering("second", RemoteCommandResult::success));
    first.reset();
    targets_.previousTrackCommand().setEnabled(false);
    EXPECT_EQ(changes_, 1);
    targets_.playCommand().setEnabled(false);
    second.reset();
    EXPECT_EQ(changes_, 2);
}

TEST(RemoteTargetsLifetime, RegistrationsMayOutliveTheTargets) {
    RegistrationHandle registration;
    {
        RemoteTargets targets;
        registration = targets.playCommand().addTarget([] { return RemoteCommandResult::success; });
    }
    registration.reset();
}

TEST(RemoteTargetsThreads, TargetsComeAndGoWhileCommandsAreDelivered) {
    constexpr int rounds = 2000;
    RemoteTargets targets;
    const auto permanent = targets.pauseCommand().addTarget([] { return RemoteCommandResult::success; });
    std::thread registering([&] {
        for (int round = 0; round < rounds; ++round)
            const auto passing =
                targets.pauseCommand().addTarget([] { return RemoteCommandResult::commandFailed; });
    });
    for (int round = 0; round < rounds; ++round)
        ASSERT_EQ(targets.deliver(RemoteCommandKind::pause), RemoteCommandResult::success);
    registering.join();
}

} // namespace
} // namespace tarn
