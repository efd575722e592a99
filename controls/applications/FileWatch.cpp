#include "controls/applications/FileWatch.h"

#include <array>
#include <cstdint>

#include <sys/inotify.h>

namespace tarn {

namespace {

constexpr std::uint32_t changes = IN_ATTRIB | IN_CLOSE_WRITE | IN_CREATE | IN_DELETE | IN_DELETE_SELF |
                                  IN_MODIFY | IN_MOVE_SELF | IN_MOVED_FROM | IN_MOVED_TO;

} // namespace

FileWatch::FileWatch() : notes_(inotify_init1(IN_CLOEXEC | IN_NONBLOCK)) {}

void FileWatch::add(const std::filesystem::path& path) {
    inotify_add_watch(notes_.get(), path.c_str(), changes);
}

bool FileWatch::sawChange() const {
    std::array<char, 4096>
        notes; // NOLINT(cppcoreguidelines-pro-type-member-init): only whether there are any
    bool any = false;
    while (::read(notes_.get(), notes.data(), notes.size()) > 0)
        any = true;
    return any;
}

} // namespace tarn
