#include "mediaprocess/LockDown.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include <csignal>
#include <span>

#include "tests/support/TemporaryFolder.h"

namespace tarn {
namespace {

/// Something that a stranger's file could make its process try; true when it was possible.
struct Attempt {
    const char* what;
    bool (*succeeds)(int file);
};

bool succeedsInMapping(std::size_t size, int protection, int flags, int file) {
    return ::mmap(nullptr, size, protection, flags, file, 0) != MAP_FAILED;
}

constexpr Attempt refused[] = {
    {"open a file", [](int) { return ::open("/etc/passwd", O_RDONLY) >= 0; }},
    {"make a socket", [](int) { return ::socket(AF_UNIX, SOCK_STREAM, 0) >= 0; }},
    {"connect", [](int file) { return ::connect(file, nullptr, 0) == 0 || errno != EPERM; }},
    {"execute a program", [](int) { return ::execl("/bin/true", "true", nullptr) == 0; }},
    {"fork", [](int) { return ::fork() >= 0; }},
    {"signal", [](int) { return ::kill(::getppid(), 0) == 0; }},
    {"write to its file", [](int file) { return ::pwrite(file, "x", 1, 0) == 1; }},
    {"write at the client's offset", [](int file) { return ::write(file, "x", 1) == 1; }},
    {"change its file's length", [](int file) { return ::ftruncate(file, 0) == 0; }},
    {"map its file to be written",
     [](int file) { return succeedsInMapping(4096, PROT_READ | PROT_WRITE, MAP_SHARED, file); }},
    {"have executable memory",
     [](int) { return succeedsInMapping(4096, PROT_READ | PROT_EXEC, MAP_PRIVATE | MAP_ANONYMOUS, -1); }},
    {"have 250 MiB of memory",
     [](int) {
         return succeedsInMapping(std::size_t{250} << 20, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS,
                                  -1);
     }},
};

constexpr Attempt possible[] = {
    {"read its file", [](int file) { return ::pread(file, std::array<char, 4>{}.data(), 4, 0) == 4; }},
    {"have 100 MiB of memory",
     [](int) {
         return succeedsInMapping(std::size_t{100} << 20, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS,
                                  -1);
     }},
};

// What a child has found out stands in memory that it shares with the test.
TEST(LockDown, LeavesAProcessItsFileAndMemoryAndNothingElse) {
#ifdef TARN_SANITIZED
    GTEST_SKIP() << "sanitizers need what it takes away";
#endif
    const TemporaryFolder folder;
    const auto path = folder.write("file", "text");
    const FileDescriptor file(::open(path.c_str(), O_RDWR | O_CLOEXEC));
    auto* found =
        static_cast<bool*>(::mmap(nullptr, 4096, PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    ASSERT_NE(found, MAP_FAILED);
    const pid_t child = ::fork();
    if (child == 0) {
        const auto locks = lockDown(privateMemory());
        std::size_t index = 0;
        for (const std::span<const Attempt> attempts : {std::span<const Attempt>(refused), {possible}})
            for (const Attempt& attempt : attempts)
                found[index++] = attempt.succeeds(file.get());
        _exit(static_cast<int>(locks));
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status));
    EXPECT_EQ(static_cast<unsigned>(WEXITSTATUS(status)), lockedEverything);
    std::size_t index = 0;
    for (const Attempt& attempt : refused)
        EXPECT_FALSE(found[index++]) << attempt.what;
    for (const Attempt& attempt : possible)
        EXPECT_TRUE(found[index++]) << attempt.what;
    ::munmap(found, 4096);
}

} // namespace
} // namespace tarn
