#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>

#include "roles/Registration.h"
#include "system/FileDescriptor.h"

namespace tarn {

/// Descriptors that come and go and are watched by one that stays: descriptor() is readable when one of them
/// is. Player thread; registrations must not outlive the watches.
class DescriptorWatches {
public:
    /// Throws std::system_error.
    DescriptorWatches();

    int descriptor() const { return epoll_.get(); }

    /// Has `readable` called by callReady() as long as there is something to be read, or the other end is
    /// gone. The registration goes before the descriptor does.
    RegistrationHandle add(int watched, std::function<void()> readable);

    void callReady();

private:
    class Watch;

    const FileDescriptor epoll_;
    std::uint64_t lastKey_ = 0;
    std::map<std::uint64_t, std::shared_ptr<std::function<void()>>> calls_;
};

} // namespace tarn
