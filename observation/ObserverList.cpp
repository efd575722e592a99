#include "observation/ObserverList.h"

#include <atomic>
#include <cstdint>
#include <thread>
#include <utility>

namespace tarn {

/// One registration. The thread that finds the observer free makes the calls, also for the changes that
/// others see meanwhile; these are only marked.
class ObserverList::Observer {
public:
    /// The calls are the maker's, beginning with the initial one.
    Observer(std::string_view keyPath, Observable::Block block)
        : keyPath_(keyPath), block_(std::move(block)) {}

    std::string_view keyPath() const { return keyPath_; }
    bool hasEnded() const { return (state_ & ended) != 0; }

    /// True when the calls for it are the caller's to make.
    bool markChanged() {
        state_ |= changed;
        return take();
    }

    /// Between two calls the observer stands free for a moment: a thread that changes the value without pause
    /// takes over then, and this one gets on.
    void makeCalls(Observable& object, Read read) {
        for (;;) {
            makeCall(object, read);
            if (letGo() != changed)
                return;
            std::this_thread::yield();
            if (!take())
                return;
        }
    }

    void end() {
        if ((state_.fetch_or(ended) & (calling | ended)) == 0)
            block_ = nullptr;
    }

private:
    static constexpr std::uint8_t changed = 1; // since the last call began
    static constexpr std::uint8_t calling = 2; // someone makes the calls; only they touch the block
    static constexpr std::uint8_t ended = 4;

    bool take() {
        std::uint8_t free = changed;
        return state_.compare_exchange_strong(free, changed | calling);
    }

    void makeCall(Observable& object, Read read) {
        state_ &= static_cast<std::uint8_t>(~changed);
        try {
            block_(object, {{"new", read(object, keyPath_)}});
        } catch (...) {
            letGo(); // or no later change would be reported
            throw;
        }
    }

    /// What is marked now. What the block of an ended observation holds goes with its last call.
    std::uint8_t letGo() {
        const auto left = static_cast<std::uint8_t>(state_.fetch_and(changed | ended) & (changed | ended));
        if ((left & ended) != 0)
            block_ = nullptr;
        return left;
    }

    const std::string_view keyPath_;
    Observable::Block block_;
    std::atomic<std::uint8_t> state_ = calling;
};

class ObserverList::Membership final : public Registration {
public:
    explicit Membership(std::shared_ptr<Observer> observer) : observer_(std::move(observer)) {}
    ~Membership() override { observer_->end(); }

private:
    const std::shared_ptr<Observer> observer_;
};

ObserverList::~ObserverList() {
    const auto observers = observers_.withLocked([](auto& list) { return std::move(list); });
    for (const auto& observer : observers)
        observer->end();
}

RegistrationHandle ObserverList::observe(std::string_view keyPath, Observable::Block block) {
    auto observer = std::make_shared<Observer>(keyPath, std::move(block));
    auto membership = std::make_unique<Membership>(observer);
    observers_.withLocked([&](auto& list) {
        std::erase_if(list, [](const auto& other) { return other->hasEnded(); });
        list.push_back(observer);
    });
    observer->makeCalls(object_, read_);
    return membership;
}

void ObserverList::changed(std::string_view keyPath) {
    const auto observers = observers_.withLocked([&](const auto& list) {
        std::vector<std::shared_ptr<Observer>> matching;
        for (const auto& observer : list)
            if (observer->keyPath() == keyPath)
                matching.push_back(observer);
        return matching;
    });
    for (const auto& observer : observers)
        if (observer->markChanged())
            observer->makeCalls(object_, read_);
}

} // namespace tarn
