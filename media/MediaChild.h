#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <utility>

#include "media/MediaParent.h"
#include "mediaprotocol/Channel.h"

namespace tarn {

/// One child of the parent, and the socket to it. It is ended with this object, whatever it is doing. Moves
/// between threads; used by one at a time.
class MediaChild {
public:
    MediaChild(Channel channel, std::shared_ptr<MediaParent> parent, std::uint64_t id)
        : channel_(std::move(channel)), parent_(std::move(parent)), id_(id) {}

    MediaChild(MediaChild&&) noexcept = default;
    MediaChild& operator=(MediaChild&& other) noexcept {
        std::swap(channel_, other.channel_);
        std::swap(parent_, other.parent_);
        std::swap(id_, other.id_);
        return *this;
    }
    ~MediaChild() {
        if (parent_)
            parent_->kill(id_);
    }

    const Channel& channel() const { return channel_; }

    /// How long the end of the parent may take to be seen behind that of the child.
    static constexpr std::chrono::milliseconds parentEndsWithin{20};

    /// Of a child that has ended: the parent has too, and so that says nothing about what the child was
    /// asked. Waits so long for it.
    bool endedWithItsParent(std::chrono::milliseconds within = parentEndsWithin) const {
        return parent_->isGone(within);
    }

private:
    Channel channel_;
    std::shared_ptr<MediaParent> parent_; // null when moved away
    std::uint64_t id_;
};

} // namespace tarn
