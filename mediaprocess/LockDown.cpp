#include "mediaprocess/LockDown.h"

#include <seccomp.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/resource.h>

#include <cerrno>
#include <fstream>
#include <memory>
#include <type_traits>

namespace tarn {

namespace {

// Less silently cuts the index of an M4A file of twelve hours.
constexpr std::uint64_t memoryMargin = std::uint64_t{192} << 20;
constexpr rlim_t mostOpenFiles = 16;

// The sanitizers need many more calls, also to tell what they have found, and more memory than the margin.
#ifdef TARN_SANITIZED
constexpr bool sanitized = true;
#else
constexpr bool sanitized = false;
#endif

// By name, as they are not the same on all processors; those that a processor does not have are left out.
constexpr const char* allowedCalls[] = {
    "pread64",         "fstat", "fstat64",    "recvmsg",      "sendmsg",   "futex",
    "futex_time64",    "close", "munmap",     "mremap",       "brk",       "clock_gettime",
    "clock_gettime64", "exit",  "exit_group", "rt_sigreturn", "sigreturn", "restart_syscall",
};

struct FilterDelete {
    void operator()(void* filter) const { seccomp_release(filter); }
};
using Filter = std::unique_ptr<std::remove_pointer_t<scmp_filter_ctx>, FilterDelete>;

bool allow(scmp_filter_ctx filter, const char* name) {
    const int number = seccomp_syscall_resolve_name(name);
    return number == __NR_SCMP_ERROR || number < 0 ||
           seccomp_rule_add_array(filter, SCMP_ACT_ALLOW, number, 0, nullptr) == 0;
}

/// Memory of its own that is not executable: neither code nor a way to write to the file.
bool allowMemory(scmp_filter_ctx filter, const char* name) {
    const int number = seccomp_syscall_resolve_name(name);
    const scmp_arg_cmp rules[] = {
        {2, SCMP_CMP_MASKED_EQ, PROT_EXEC, 0},
        {3, SCMP_CMP_MASKED_EQ, MAP_SHARED, 0},
    };
    return number == __NR_SCMP_ERROR || number < 0 ||
           seccomp_rule_add_array(filter, SCMP_ACT_ALLOW, number, 2, rules) == 0;
}

bool lockSystemCalls() {
    // By prctl(2): service managers refuse seccomp(2), for which the library would then have no way.
    seccomp_api_set(1);
    const Filter filter(seccomp_init(SCMP_ACT_ERRNO(EPERM)));
    if (!filter)
        return false;
    for (const char* name : allowedCalls)
        if (!allow(filter.get(), name))
            return false;
    return allowMemory(filter.get(), "mmap") && allowMemory(filter.get(), "mmap2") &&
           seccomp_load(filter.get()) == 0;
}

void setLimit(__rlimit_resource resource, rlim_t most) {
    const rlimit limit{most, most};
    ::setrlimit(resource, &limit);
}

bool lockMemory(std::uint64_t ownMemory) {
    if (ownMemory == 0)
        return false;
    const rlimit limit{ownMemory + memoryMargin, ownMemory + memoryMargin};
    return ::setrlimit(RLIMIT_DATA, &limit) == 0;
}

} // namespace

std::uint64_t privateMemory() {
    std::ifstream status("/proc/self/status");
    for (std::string word; status >> word;)
        if (word == "VmData:") {
            std::uint64_t kibibytes = 0;
            status >> kibibytes;
            return kibibytes * 1024;
        }
    return 0;
}

std::uint32_t lockDown(std::uint64_t ownMemory) {
    ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
    setLimit(RLIMIT_CORE, 0);
    setLimit(RLIMIT_FSIZE, 0);
    setLimit(RLIMIT_NOFILE, mostOpenFiles);
    std::uint32_t locks = 0;
    if (!sanitized && lockMemory(ownMemory))
        locks |= lockedMemory;
    if (!sanitized && lockSystemCalls())
        locks |= lockedSystemCalls;
    return locks;
}

} // namespace tarn
