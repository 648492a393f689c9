#include "guard.h"

#include "confinement.h"
#include "convert/files/filegate.h"
#include "convert/files/modelfiles.h"
#include "lowercase.h"
#include "progress.h"
#include "sanitizers.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <climits>
#include <csignal>
#include <cstring>
#include <new>
#include <vector>

#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

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

/// A connection: the parent has the first end and the child the second.
class Connection
{
public:
    ~Connection()
    {
        closeEnd(0);
        closeEnd(1);
    }
    Connection() = default;
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

    bool openPipe() { return pipe2(m_ends, O_CLOEXEC) == 0; }
    bool openSocket() { return socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, m_ends) == 0; }
    int operator[](int end) const { return m_ends[end]; }
    void closeEnd(int end)
    {
        if (m_ends[end] >= 0)
            close(m_ends[end]);
        m_ends[end] = -1;
    }

private:
    int m_ends[2] = {-1, -1};
};

/// Shared by parent and child.
struct Link
{
    File handover;         ///< in memory
    Connection life;       ///< a pipe that the child closes by ending
    Connection files;      ///< a socket over which the child asks for files
    Connection complaints; ///< a pipe with the reason if the system does not confine the child
};

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

/// Closes all inherited descriptors except the standard streams and the listed ones.
void closeOthers(std::vector<unsigned> kept)
{
    std::sort(kept.begin(), kept.end());
    unsigned first = STDERR_FILENO + 1;
    for (const unsigned descriptor : kept)
    {
        if (descriptor > first)
            close_range(first, descriptor - 1, 0);
        first = std::max(first, descriptor + 1);
    }
    close_range(first, UINT_MAX, 0);
}

/// Address space of this process before any work: the program and its libraries.
uint64_t getAddressSpace()
{
    unsigned long pages = 0;
    const File file(std::fopen("/proc/self/statm", "r"));
    return file && std::fscanf(file.get(), "%lu", &pages) == 1 ? pages * uint64_t(sysconf(_SC_PAGESIZE)) : 0;
}

/// Silences standard error: the parent has a better message than a dying library. Not with address checks, whose
/// reports are needed.
/// @return the descriptor by which progress is still shown; -1 for none.
int silence()
{
    const int progress = moveProgress();
    const int nowhere = CAN_LIMIT_MEMORY ? open("/dev/null", O_WRONLY | O_CLOEXEC) : -1;
    if (nowhere >= 0)
        dup2(nowhere, STDERR_FILENO);
    return progress;
}

[[noreturn]] void runChild(const Limits& limits, const Work& work, const std::string& model, Link& link,
                           pid_t parent)
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != parent)
        _exit(INCOMPLETE); // it ended before the line above
    setLimit(RLIMIT_CORE, 0);
    if (CAN_LIMIT_MEMORY && limits.mebibytes > 0)
        setLimit(RLIMIT_AS, getAddressSpace() + (limits.mebibytes << 20));
    const int progress = silence();
    std::FILE* handover = link.handover.get();
    closeOthers({unsigned(fileno(handover)), unsigned(link.life[1]), unsigned(link.files[1]),
                 unsigned(link.complaints[1]), unsigned(progress < 0 ? STDERR_FILENO : progress)});
    ModelFiles files(model, link.files[1]);
    std::string error;
    if (!confine(link.files[1], error) &&
        write(link.complaints[1], error.data(), error.size()) != ssize_t(error.size()))
        _exit(INCOMPLETE);
    link.complaints.closeEnd(1);
    // At once, before the importer catches the exception and reports another error.
    std::set_new_handler([] { _exit(OUT_OF_MEMORY); });
    const bool complete = work(handover, files) && std::fflush(handover) == 0;
    _exit(complete ? 0 : INCOMPLETE); // skips the parent's exit handlers
}

/// Once for a process: the reason is the same for every child.
void complainOnce(int pipe)
{
    static bool hasComplained = false;
    char reason[100] = {};
    if (read(pipe, reason, sizeof reason - 1) <= 0 || hasComplained)
        return;
    hasComplained = true;
    std::fprintf(stderr,
                 "orv-convert: this system does not confine processes (%s); the model is read unconfined\n",
                 reason);
}

/// Answers the child's requests until its end of the pipe is closed, that is, until it ends.
/// @param seconds  0: for ever.
/// @return false if it has not ended in time.
bool serveUntilEnd(const Link& link, FileGate& gate, double seconds)
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
        pollfd events[] = {{link.life[0], POLLIN, 0}, {link.files[0], POLLIN, 0}};
        if (poll(events, 2, milliseconds) <= 0)
            continue;
        if (events[0].revents != 0)
            return true;
        if (events[1].revents & POLLIN)
            answerRequest(gate, link.files[0]);
    }
}

/// A known fault of libassimp's reader of a format.
std::string getKnownFault(const std::string& model)
{
    const std::string extension = toLowerCase(model.substr(model.find_last_of('.') + 1));
    return extension == "3mf" ? "; libassimp 5.2 is known to crash on some sound 3MF files" : "";
}

std::string describe(int status, const std::string& model, const Limits& limits)
{
    if (WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL)
        return "the conversion was killed, perhaps because the system ran out of memory";
    if (WIFSIGNALED(status))
    {
        const int signal = WTERMSIG(status);
        const char* name = sigabbrev_np(signal);
        return std::string("the conversion crashed (SIG") + (name ? name : std::to_string(signal).c_str()) +
               "); the file is damaged, or the importer is at fault" + getKnownFault(model);
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
bool supervise(pid_t child, const std::string& model, const Link& link, FileGate& gate, const Limits& limits,
               std::string& error)
{
    complainOnce(link.complaints[0]);
    const bool inTime = serveUntilEnd(link, gate, limits.seconds);
    if (!inTime)
        kill(child, SIGKILL);
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR)
        ;
    if (!inTime)
        error = describeTimeout(limits.seconds);
    else if (status != 0)
        error = describe(status, model, limits);
    return inTime && status == 0;
}

} // namespace

bool runGuarded(const Limits& limits, const std::string& model, FileGate& gate, const Work& work,
                const std::function<bool(std::FILE*)>& accept, std::string& error)
{
    Link link;
    link.handover = makeMemoryFile();
    if (!link.handover || !link.life.openPipe() || !link.files.openSocket() || !link.complaints.openPipe())
        return failWithErrno("no handover file", error);

    std::fflush(nullptr); // or the child would write the same bytes again
    const pid_t parent = getpid();
    const pid_t child = fork();
    if (child == 0)
        runChild(limits, work, model, link, parent);
    for (Connection* connection : {&link.life, &link.files, &link.complaints})
        connection->closeEnd(1);
    const bool done = child > 0 ? supervise(child, model, link, gate, limits, error)
                                : failWithErrno("no child process", error);
    if (!done)
        return false;
    std::rewind(link.handover.get());
    if (accept(link.handover.get()))
        return true;
    error = "the conversion left no result";
    return false;
}

} // namespace convert
