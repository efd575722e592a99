#pragma once

#include <sys/types.h>

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>

#include "mediaprotocol/Channel.h"

namespace tarn {

/// Where the program that touches media is installed; none when it is not.
std::optional<std::string> mediaProgram();

/// The running program that touches media, from its start to its end. Its children end with it.
///
/// It has the libraries loaded and forks a child when one is wanted; it holds no media file, so that nothing
/// can keep it from ending. Any thread may call; isGood() is called by one at a time.
class MediaParent {
public:
    /// Null when it cannot be started; one error line says why.
    static std::shared_ptr<MediaParent> start();

    MediaParent(pid_t process, Channel control) : process_(process), control_(std::move(control)) {}
    ~MediaParent();
    MediaParent(const MediaParent&) = delete;
    MediaParent& operator=(const MediaParent&) = delete;

    /// Has a child made; what is sent to it before it is there waits for it. False when the parent is gone.
    bool fork(ChildKind kind, std::uint64_t id, std::span<const int> files) const;

    /// Ends a child, whatever it is doing.
    void kill(std::uint64_t id) const;

    /// False when it is gone, or a child of it has crashed: all share one layout of memory, which whoever
    /// made that one crash may have begun to learn.
    bool isGood() const;

    /// Whether it has ended, or does within this time. The end of a child that it brought about may be seen a
    /// moment before its own.
    bool isGone(std::chrono::milliseconds within) const;

private:
    const pid_t process_;
    const Channel control_;
};

} // namespace tarn
