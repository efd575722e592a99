#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <barrier>
#include <new>
#include <thread>

#include "observation/LocalNotificationCenter.h"
#include "observation/ObserverList.h"

namespace tarn {
namespace {

/// An object with one property, "value".
class Subject final : public Observable {
public:
    RegistrationHandle observe(std::string_view keyPath, Block block) override {
        return observers_.observe(keyPath, std::move(block));
    }

    std::int64_t value() const { return value_; }
    void setValue(std::int64_t value) {
        value_ = value;
        observers_.changed("value");
    }

private:
    std::atomic<std::int64_t> value_ = 0;
    ObserverList observers_{*this, [](const Observable& self, std::string_view) {
                                return ObservedValue(static_cast<const Subject&>(self).value_.load());
                            }};
};

std::int64_t newValue(const ChangeDescription& change) { return std::get<std::int64_t>(change.at("new")); }

TEST(ObservationTest, ReportsTheValueAtOnceAndEveryChangeAfterwards) {
    Subject subject;
    subject.setValue(1);
    std::vector<std::int64_t> reports;
    auto block = [&](Observable& object, const ChangeDescription& change) {
        EXPECT_EQ(&object, &subject);
        reports.push_back(newValue(change));
    };
    auto registration = subject.observe("value", block);
    EXPECT_THAT(reports, testing::ElementsAre(1));
    subject.setValue(2);
    subject.setValue(2);
    EXPECT_THAT(reports, testing::ElementsAre(1, 2, 2));
    registration.reset();
    subject.setValue(3);
    EXPECT_EQ(reports.size(), 3u);
}

TEST(ObservationTest, AChangeMadeInsideTheBlockIsReportedAfterIt) {
    Subject subject;
    std::vector<std::string> order;
    auto registration = subject.observe("value", [&](Observable&, const ChangeDescription& change) {
        order.push_back("begin " + std::to_string(newValue(change)));
        if (newValue(change) == 1)
            subject.setValue(2);
        order.push_back("end " + std::to_string(newValue(change)));
    });
    subject.setValue(1);
    EXPECT_THAT(order, testing::ElementsAre("begin 0", "end 0", "begin 1", "end 1", "begin 2", "end 2"));
}

TEST(ObservationTest, TheBlockMayEndItsOwnRegistrationOrOutliveItsObject) {
    auto subject = std::make_unique<Subject>();
    RegistrationHandle registration;
    int calls = 0;
    registration = subject->observe("value", [&](Observable&, const ChangeDescription&) {
        ++calls;
        registration.reset();
    });
    subject->setValue(1);
    subject->setValue(2);
    EXPECT_EQ(calls, 2);

    auto orphan = subject->observe("value", [](Observable&, const ChangeDescription&) {});
    subject.reset();
    orphan.reset();
}

TEST(ObservationTest, ABlockThatThrowsHearsOfTheNextChange) {
    Subject subject;
    std::int64_t last = 0;
    auto registration = subject.observe("value", [&](Observable&, const ChangeDescription& change) {
        if (newValue(change) == 1)
            throw std::bad_alloc();
        last = newValue(change);
    });
    EXPECT_THROW(subject.setValue(1), std::bad_alloc);
    subject.setValue(2);
    EXPECT_EQ(last, 2);
}

// A stale value reported last would stay with the client for ever.
TEST(ObservationTest, TheLastReportIsTheLastValueHoweverRegistrationAndChangesMeet) {
    constexpr int rounds = 4'000;
    std::unique_ptr<Subject> subject;
    std::barrier barrier(3);
    auto change = [&](std::int64_t first) {
        for (int round = 0; round < rounds; ++round) {
            barrier.arrive_and_wait();
            subject->setValue(first);
            subject->setValue(first + 1);
            barrier.arrive_and_wait();
        }
    };
    std::jthread one(change, 10);
    std::jthread other(change, 20);
    for (int round = 0; round < rounds; ++round) {
        subject = std::make_unique<Subject>();
        std::int64_t last = -1; // unguarded: the calls are serialized
        int calls = 0;
        barrier.arrive_and_wait();
        auto registration = subject->observe("value", [&](Observable&, const ChangeDescription& report) {
            last = newValue(report);
            ++calls;
        });
        barrier.arrive_and_wait();
        std::int64_t value = -2;
        auto check = subject->observe(
            "value", [&](Observable&, const ChangeDescription& report) { value = newValue(report); });
        ASSERT_EQ(last, value);
        ASSERT_LE(calls, 5);
    }
}

TEST(NotificationTest, ReachesTheHandlersOfThatNameAndSenderInOrder) {
    LocalNotificationCenter center;
    int sender = 0;
    int stranger = 0;
    std::string heard;
    auto first = center.addObserver("name", &sender, [&](const Notification&) { heard += "1"; });
    auto second = center.addObserver(
        "name", &sender, [&](const Notification& n) { heard += std::to_string(n.info.at("key")); });
    center.post({"name", &sender, {{"key", 2}}});
    center.post({"other", &sender, {}});
    center.post({"name", &stranger, {}});
    EXPECT_EQ(heard, "12");
}

TEST(NotificationTest, AHandlerMayRemoveItselfAddAnotherAndEndAThird) {
    LocalNotificationCenter center;
    std::string heard;
    RegistrationHandle first, added, third;
    first = center.addObserver("name", nullptr, [&](const Notification&) {
        heard += "1";
        added = center.addObserver("name", nullptr, [&](const Notification&) { heard += "a"; });
        third.reset();
        first.reset();
    });
    third = center.addObserver("name", nullptr, [&](const Notification&) { heard += "3"; });
    center.post({"name", nullptr, {}});
    EXPECT_EQ(heard, "1");
    center.post({"name", nullptr, {}});
    EXPECT_EQ(heard, "1a");
}

} // namespace
} // namespace tarn
