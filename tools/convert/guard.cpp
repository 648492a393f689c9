#include "guard.h"

#include <cerrno>
#include <chrono>
#include <climits>
#include <csignal>
#include <cstring>
#include <memory>
#include <new>

#include <poll.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

// The one place that knows about sanitizers: GCC says so by a macro, Clang by a feature.
#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define ORV_CHECKS_ADDRESSES
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#define ORV_CHECKS_ADDRESSES
#endif

namespace convert
{

#ifdef ORV_CHECKS_ADDRESSES
const bool CAN_LIMIT_MEMORY = false;
#else
const bool CAN_LIMIT_MEMORY = true;
#endif

namespace
{

constexpr int INCOMPLETE = 1; // the child's exit codes
constexpr int OUT_OF_MEMORY = 101;

using Clock = std::chrono::steady_clock;

struct FileCloser
{
    void operator()(std::FILE* file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

File makeMemoryFile()
{
    const int descriptor = memfd_create("orv-convert", MFD_CLOEXEC);
    return File(descriptor < 0 ? nullptr : fdopen(descriptor, "w+b"));
}

bool failWithErrno(const char* what, std::string& error)
{
    error = std::string(what) + ": " + std::strerror(errno);
    return false;
}

void setLimit(int resource, uint64_t value)
{
    const rlimit limit = {value, value};
    setrlimit(resource, &limit);
}

[[noreturn]] void runChild(const Limits& limits, const std::function<bool(std::FILE*)>& work,
                           std::FILE* handover, pid_t parent)
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != parent)
        _exit(INCOMPLETE); // it ended before the line above
    setLimit(RLIMIT_CORE, 0);
    if (CAN_LIMIT_MEMORY && limits.mebibytes > 0)
        setLimit(RLIMIT_AS, limits.mebibytes << 20);
    // Before anybody catches the exception and makes something else of it.
    std::set_new_handler([] { _exit(OUT_OF_MEMORY); });
    const bool complete = work(handover) && std::fflush(handover) == 0;
    _exit(complete ? 0 : INCOMPLETE); // without what the parent has registered for its own end
}

/// Waits until the child has closed its end of the pipe, which it does by ending.
/// @param seconds  0: for ever.
/// @return false if it has not ended in time.
bool waitForEnd(int pipe, double seconds)
{
    const Clock::time_point start = Clock::now();
    for (;;)
    {
        int milliseconds = -1;
        if (seconds > 0.0)
        {
            const double left =
                seconds * 1e3 - std::chrono::duration<double, std::milli>(Clock::now() - start).count();
            if (left <= 0.0)
                return false;
            milliseconds = left < INT_MAX ? int(left) + 1 : INT_MAX;
        }
        pollfd end = {pipe, POLLIN, 0};
        if (poll(&end, 1, milliseconds) > 0)
            return true;
    }
}

std::string describe(int status, const Limits& limits)
{
    if (WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL)
        return "the conversion was killed, as systems do that run out of memory";
    if (WIFSIGNALED(status))
    {
        const int signal = WTERMSIG(status);
        const char* name = sigabbrev_np(signal);
        return std::string("the conversion crashed (SIG") + (name ? name : std::to_string(signal).c_str()) +
               "); the file is damaged, or the importer is at fault";
    }
    if (WEXITSTATUS(status) != OUT_OF_MEMORY)
        return "the conversion ended early (exit code " + std::to_string(WEXITSTATUS(status)) + ")";
    if (limits.mebibytes == 0 || !CAN_LIMIT_MEMORY)
        return "there is not enough memory";
    return "more than " + std::to_string(limits.mebibytes) +
           " MiB of memory would be needed (see --memory-limit)";
}

std::string describeTimeout(double seconds)
{
    char text[100];
    std::snprintf(text, sizeof text, "not done after %g seconds (see --time-limit)", seconds);
    return text;
}

/// @return whether the child has done its work.
bool supervise(pid_t child, int pipe, const Limits& limits, std::string& error)
{
    const bool inTime = waitForEnd(pipe, limits.seconds);
    if (!inTime)
        kill(child, SIGKILL);
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR)
        ;
    if (!inTime)
        error = describeTimeout(limits.seconds);
    else if (status != 0)
        error = describe(status, limits);
    return inTime && status == 0;
}

} // namespace

bool runGuarded(const Limits& limits, const std::function<bool(std::FILE*)>& work,
                const std::function<bool(std::FILE*)>& accept, std::string& error)
{
    const File handover = makeMemoryFile();
    int ends[2];
    if (!handover || pipe(ends) != 0)
        return failWithErrno("no handover file", error);

    std::fflush(nullptr); // or the child has the same bytes to write again
    const pid_t parent = getpid();
    const pid_t child = fork();
    if (child == 0)
    {
        close(ends[0]);
        runChild(limits, work, handover.get(), parent);
    }
    close(ends[1]);
    const bool done =
        child > 0 ? supervise(child, ends[0], limits, error) : failWithErrno("no child process", error);
    close(ends[0]);
    if (!done)
        return false;
    std::rewind(handover.get());
    if (accept(handover.get()))
        return true;
    error = "the conversion left no result";
    return false;
}

} // namespace convert
