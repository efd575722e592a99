#pragma once

#include <concepts>
#include <cstddef>
#include <memory>
#include <new>
#include <type_traits>
#include <utility>

namespace tarn {

/// A piece of work for a queue: like std::function<void()>, but it is moved, never copied, and what a
/// command's work captures fits inside, so that handing it on costs no allocation.
class Work {
public:
    Work() = default;
    Work(std::nullptr_t) {}

    // NOLINTBEGIN(bugprone-forwarding-reference-overload): the check does not see that it is constrained
    template <class Callable>
    requires(!std::same_as<std::remove_cvref_t<Callable>, Work> &&
             std::invocable<std::remove_cvref_t<Callable>&>) Work(Callable&& callable) {
        using Held = std::remove_cvref_t<Callable>;
        if constexpr (fitsInside<Held>) {
            ::new (place_) Held(std::forward<Callable>(callable));
            operations_ = &operationsOf<Held>;
        } else {
            *this = Work([held = std::make_unique<Held>(std::forward<Callable>(callable))] { (*held)(); });
        }
    }
    // NOLINTEND(bugprone-forwarding-reference-overload)

    Work(Work&& other) noexcept { take(other); }
    Work& operator=(Work&& other) noexcept {
        Work displaced(std::move(*this)); // ends last: it may hold whoever holds this
        take(other);
        return *this;
    }
    ~Work() {
        if (operations_ != nullptr)
            operations_->destroy(place_);
    }

    explicit operator bool() const { return operations_ != nullptr; }
    void operator()() { operations_->run(place_); }

private:
    static constexpr std::size_t size = 6 * sizeof(void*);

    struct Operations {
        void (*run)(void* held);
        void (*moveTo)(void* held, void* place) noexcept; // and destroys what was moved from
        void (*destroy)(void* held) noexcept;
    };

    // NOLINTBEGIN(misc-redundant-expression): it takes the size and the alignment for one
    template <class Held>
    static constexpr bool
        fitsInside = sizeof(Held) <= size &&
                     alignof(Held) <= alignof(std::max_align_t) && std::is_nothrow_move_constructible_v<Held>;
    // NOLINTEND(misc-redundant-expression)

    template <class Held>
    static constexpr Operations operationsOf{[](void* held) { (*static_cast<Held*>(held))(); },
                                             [](void* held, void* place) noexcept {
                                                 ::new (place) Held(std::move(*static_cast<Held*>(held)));
                                                 static_cast<Held*>(held)->~Held();
                                             },
                                             [](void* held) noexcept { static_cast<Held*>(held)->~Held(); }};

    void take(Work& other) noexcept {
        operations_ = std::exchange(other.operations_, nullptr);
        if (operations_ != nullptr)
            operations_->moveTo(other.place_, place_);
    }

    alignas(std::max_align_t) std::byte place_[size];
    const Operations* operations_ = nullptr;
};

} // namespace tarn
