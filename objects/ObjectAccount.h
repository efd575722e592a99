#pragma once

#include <atomic>
#include <cstddef>
#include <memory>
#include <optional>
#include <utility>

namespace tarn {

/// What the objects of one client take in memory, roughly, so that no client makes the service grow without
/// end. Any thread may call.
class ObjectAccount final : public std::enable_shared_from_this<ObjectAccount> {
public:
    static constexpr std::size_t most =
        std::size_t{32} * 1'048'576; ///< 35,000 tracks, or 5,000 queue players

    // What an object takes beside its texts, in bytes.
    static constexpr std::size_t ofAsset = 500;
    static constexpr std::size_t ofItem = 400;
    static constexpr std::size_t ofQueuePlayer = 6'000;
    static constexpr std::size_t ofQueuedItem = 120;

    /// What one object takes; given back with this.
    class Charge {
    public:
        Charge() = default;
        Charge(std::shared_ptr<ObjectAccount> account, std::size_t bytes)
            : account_(std::move(account)), bytes_(bytes) {}
        Charge(Charge&& other) noexcept : account_(std::move(other.account_)), bytes_(other.bytes_) {}
        Charge& operator=(Charge&& other) noexcept {
            std::swap(account_, other.account_);
            std::swap(bytes_, other.bytes_);
            return *this;
        }
        ~Charge() {
            if (account_)
                account_->taken_ -= bytes_;
        }

    private:
        std::shared_ptr<ObjectAccount> account_;
        std::size_t bytes_ = 0;
    };

    /// None when all objects together would take more than is allowed.
    std::optional<Charge> charge(std::size_t bytes) {
        if (taken_.fetch_add(bytes) + bytes > most) {
            taken_ -= bytes;
            return std::nullopt;
        }
        return Charge(shared_from_this(), bytes);
    }

private:
    std::atomic<std::size_t> taken_ = 0;
};

} // namespace tarn
