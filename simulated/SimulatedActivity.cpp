#include "simulated/SimulatedActivity.h"

#include <ucontext.h>

#include <cstddef>
#include <cstdint>
#include <utility>

#include "simulated/SimulatedScheduler.h"

#if defined(__has_feature) // clang
#if __has_feature(address_sanitizer)
#define __SANITIZE_ADDRESS__
#endif
#if __has_feature(thread_sanitizer)
#define __SANITIZE_THREAD__
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/common_interface_defs.h>
#elif defined(__SANITIZE_THREAD__)
#include <sanitizer/tsan_interface.h>
#endif

namespace tarn {

/// Where a stack lies and where it was left. The sanitizers have to be told whenever the stack changes.
struct SimulatedActivity::Stack {
    static constexpr std::size_t ownSize = std::size_t{256} * 1024;

    std::unique_ptr<std::byte[]> memory; // none for the caller's
    ucontext_t context{};
    const void* bottom = nullptr;
    std::size_t size = 0;
    [[maybe_unused]] void* fake = nullptr;  // the address sanitizer's
    [[maybe_unused]] void* fiber = nullptr; // the thread sanitizer's
    Stack* before = nullptr;                // the one that was left for this one

#if defined(__SANITIZE_ADDRESS__)
    void beforeLeaving(const Stack& next) { __sanitizer_start_switch_fiber(&fake, next.bottom, next.size); }
    void afterEntering() { __sanitizer_finish_switch_fiber(fake, &before->bottom, &before->size); }
#else
    void beforeLeaving(const Stack&) {}
    void afterEntering() {}
#endif

#if defined(__SANITIZE_THREAD__)
    void makeFiber() { fiber = memory == nullptr ? __tsan_get_current_fiber() : __tsan_create_fiber(0); }
    void switchFiber() const { __tsan_switch_to_fiber(fiber, 0); }
    ~Stack() {
        if (memory != nullptr)
            __tsan_destroy_fiber(fiber);
    }
#else
    void makeFiber() {}
    void switchFiber() const {}
#endif
};

SimulatedActivity::SimulatedActivity() : scheduler_(nullptr), stack_(std::make_unique<Stack>()) {
    stack_->makeFiber();
}

SimulatedActivity::SimulatedActivity(SimulatedScheduler& scheduler)
    : scheduler_(&scheduler), stack_(std::make_unique<Stack>()) {
    stack_->memory = std::make_unique_for_overwrite<std::byte[]>(Stack::ownSize);
    stack_->bottom = stack_->memory.get();
    stack_->size = Stack::ownSize;
    stack_->makeFiber();
    getcontext(&stack_->context);
    stack_->context.uc_stack.ss_sp = stack_->memory.get();
    stack_->context.uc_stack.ss_size = Stack::ownSize;
    auto address = std::uint64_t{reinterpret_cast<std::uintptr_t>(this)};
    makecontext(&stack_->context, reinterpret_cast<void (*)()>(&begin), 2,
                static_cast<unsigned>(address >> 32), static_cast<unsigned>(address));
}

SimulatedActivity::~SimulatedActivity() = default;

void SimulatedActivity::switchTo(SimulatedActivity& next) {
    next.stack_->before = stack_.get();
    stack_->beforeLeaving(*next.stack_);
    next.stack_->switchFiber();
    swapcontext(&stack_->context, &next.stack_->context);
    stack_->afterEntering();
}

void SimulatedActivity::begin(unsigned high, unsigned low) {
    auto address = static_cast<std::uintptr_t>(std::uint64_t{high} << 32 | low);
    // NOLINTNEXTLINE(performance-no-int-to-ptr): makecontext passes integers only
    auto& activity = *reinterpret_cast<SimulatedActivity*>(address);
    activity.stack_->afterEntering();
    activity.run();
}

void SimulatedActivity::run() {
    for (;;) {
        SimulatedScheduler::Choice next{std::exchange(first, nullptr), nullptr};
        // Fresh work runs on this stack as well; only work that was left needs another.
        while (next.lane != nullptr) {
            scheduler_->runFirst(next.lane);
            next = scheduler_->choose();
        }
        scheduler_->spare_.push_back(this);
        scheduler_->current_ = next.activity;
        switchTo(*next.activity);
    }
}

} // namespace tarn
