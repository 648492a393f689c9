#include "confinement.h"

#include "sanitizers.h"

#include <cerrno>
#include <cstring>
#include <memory>

#include <asm/ioctls.h>
#include <fcntl.h>
#include <seccomp.h>
#include <unistd.h>

namespace convert
{

#ifdef ORV_CHECKS_ADDRESSES
const bool CAN_CONFINE = false;
#else
const bool CAN_CONFINE = true;
#endif

namespace
{

struct FilterReleaser
{
    void operator()(void* filter) const { seccomp_release(filter); }
};
using Filter = std::unique_ptr<void, FilterReleaser>;

/// Calls that are harmless with any arguments: memory, time, open files, this process's own signals and exit.
constexpr int HARMLESS[] = {
    SCMP_SYS(brk),
    SCMP_SYS(mmap),
    SCMP_SYS(mmap2),
    SCMP_SYS(munmap),
    SCMP_SYS(mremap),
    SCMP_SYS(mprotect),
    SCMP_SYS(madvise),
    SCMP_SYS(read),
    SCMP_SYS(readv),
    SCMP_SYS(pread64),
    SCMP_SYS(write),
    SCMP_SYS(writev),
    SCMP_SYS(pwrite64),
    SCMP_SYS(lseek),
    SCMP_SYS(_llseek),
    SCMP_SYS(fstat),
    SCMP_SYS(fstat64),
    SCMP_SYS(close),
    SCMP_SYS(futex),
    SCMP_SYS(futex_time64),
    SCMP_SYS(sched_yield),
    SCMP_SYS(sched_getaffinity),
    SCMP_SYS(clock_gettime),
    SCMP_SYS(clock_gettime64),
    SCMP_SYS(clock_nanosleep),
    SCMP_SYS(gettimeofday),
    SCMP_SYS(getrandom),
    SCMP_SYS(getrusage),
    SCMP_SYS(getpid),
    SCMP_SYS(gettid),
    SCMP_SYS(rt_sigaction),
    SCMP_SYS(rt_sigprocmask),
    SCMP_SYS(rt_sigreturn),
    SCMP_SYS(sigreturn),
    SCMP_SYS(sigaltstack),
    SCMP_SYS(restart_syscall),
    SCMP_SYS(exit),
    SCMP_SYS(exit_group),
};

/// Calls that are harmless with certain arguments only.
int allowWithArguments(void* filter, int socket)
{
    const uint64_t end = uint64_t(socket);
    const uint64_t self = uint64_t(getpid());
    const struct
    {
        int call;
        scmp_arg_cmp argument; // which one, how it is compared, with what; of a mask, the mask first
    } rules[] = {
        {SCMP_SYS(sendto), {0, SCMP_CMP_EQ, end, 0}},
        {SCMP_SYS(send), {0, SCMP_CMP_EQ, end, 0}},
        {SCMP_SYS(recvmsg), {0, SCMP_CMP_EQ, end, 0}},
        {SCMP_SYS(ioctl), {1, SCMP_CMP_EQ, TCGETS, 0}},  // whether it is a terminal
        {SCMP_SYS(fcntl), {1, SCMP_CMP_EQ, F_GETFL, 0}}, // which fdopen looks at
        {SCMP_SYS(fcntl64), {1, SCMP_CMP_EQ, F_GETFL, 0}},
        {SCMP_SYS(newfstatat), {3, SCMP_CMP_MASKED_EQ, AT_EMPTY_PATH, AT_EMPTY_PATH}}, // for open files
        {SCMP_SYS(fstatat64), {3, SCMP_CMP_MASKED_EQ, AT_EMPTY_PATH, AT_EMPTY_PATH}},
        {SCMP_SYS(statx), {2, SCMP_CMP_MASKED_EQ, AT_EMPTY_PATH, AT_EMPTY_PATH}},
        {SCMP_SYS(kill), {0, SCMP_CMP_EQ, self, 0}},
        {SCMP_SYS(tgkill), {0, SCMP_CMP_EQ, self, 0}}, // of abort()
    };
    int result = 0;
    for (const auto& rule : rules)
        result = result < 0 ? result
                            : seccomp_rule_add_array(filter, SCMP_ACT_ALLOW, rule.call, 1, &rule.argument);
    return result;
}

int loadFilter(int socket)
{
    const Filter filter(seccomp_init(SCMP_ACT_ERRNO(EACCES)));
    if (!filter)
        return -ENOMEM;
    int result = seccomp_attr_set(filter.get(), SCMP_FLTATR_API_SYSRAWRC, 1); // system error codes
    for (const int call : HARMLESS)
        result = result < 0 ? result : seccomp_rule_add(filter.get(), SCMP_ACT_ALLOW, call, 0);
    result = result < 0 ? result : allowWithArguments(filter.get(), socket);
    return result < 0 ? result : seccomp_load(filter.get());
}

} // namespace

bool confine(int socket, std::string& error)
{
    const int result = CAN_CONFINE ? loadFilter(socket) : 0;
    if (result < 0)
        error = std::strerror(-result);
    return result == 0;
}

} // namespace convert
