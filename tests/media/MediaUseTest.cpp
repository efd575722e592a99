#include <gtest/gtest.h>

#include <optional>

#include "media/MediaUse.h"

namespace tarn {
namespace {

/// Counts the timers that are set.
class CountingLoop final : public EventLoop {
public:
    void post(std::function<void()>) override {}
    RegistrationHandle at(std::chrono::nanoseconds, std::function<void()>) override {
        struct Timer final : Registration {
            explicit Timer(int& count) : timers(count) { ++timers; }
            ~Timer() override { --timers; }
            int& timers;
        };
        return std::make_unique<Timer>(timers);
    }
    bool isCurrent() const override { return true; }
    std::chrono::nanoseconds now() const override { return {}; }

    int timers = 0;
};

class NoAsset final : public MediaAsset {
public:
    const std::string& URL() const override { return URL_; }
    const std::vector<MediaMetadataItem>& commonMetadata() const override { return metadata_; }
    MediaTime duration() const override { return {}; }

private:
    const std::string URL_;
    const std::vector<MediaMetadataItem> metadata_{};
};

TEST(MediaUse, EndsWithTheLastAsset) {
    CountingLoop loop;
    std::optional<MediaUse> use(std::in_place, loop, [] {});
    const auto plain = std::make_shared<NoAsset>();
    auto first = use->counted(plain);
    auto second = use->counted(std::make_shared<NoAsset>());
    EXPECT_EQ(std::dynamic_pointer_cast<NoAsset>(first), plain) << "it is the asset itself";
    first.reset();
    EXPECT_EQ(loop.timers, 0);
    second.reset();
    EXPECT_EQ(loop.timers, 1);
    first = use->counted(plain);
    EXPECT_EQ(loop.timers, 0) << "another client has come";
    use.reset();
    first.reset();
    EXPECT_EQ(loop.timers, 0) << "an asset that outlives the engine asks nothing of it";
}

} // namespace
} // namespace tarn
