#pragma once

#include <memory>
#include <optional>

namespace tarn {

/// A std::optional that costs one pointer while it holds nothing, for what may come by the hundred
/// thousand. Reads as an optional; copies its value.
template <class Value>
class Boxed {
public:
    Boxed() = default;
    Boxed(std::optional<Value> value) {
        if (value)
            box_ = std::make_unique<std::optional<Value>>(std::move(value));
    }
    Boxed(const Boxed& other) : Boxed(other.get()) {}
    Boxed(Boxed&&) noexcept = default;
    Boxed& operator=(const Boxed& other) {
        Boxed copy(other);
        box_.swap(copy.box_);
        return *this;
    }
    Boxed& operator=(Boxed&&) noexcept = default;
    ~Boxed() = default;

    const std::optional<Value>& get() const {
        static const std::optional<Value> nothing;
        return box_ ? *box_ : nothing;
    }
    operator const std::optional<Value>&() const { return get(); }
    bool has_value() const { return box_ != nullptr; }

private:
    std::unique_ptr<std::optional<Value>> box_;
};

} // namespace tarn
