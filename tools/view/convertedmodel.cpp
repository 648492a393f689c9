#include "convertedmodel.h"

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace view
{

namespace fs = std::filesystem;

namespace
{

const char* const CONVERTER = "orv-convert";

/// @return a path, or the bare name, for which the PATH is searched.
std::string findConverter()
{
    std::error_code error;
    const fs::path self = fs::read_symlink("/proc/self/exe", error);
    if (error)
        return CONVERTER;
    for (const fs::path& folder : {self.parent_path(), self.parent_path().parent_path() / "convert"})
    {
        if (access((folder / CONVERTER).c_str(), X_OK) == 0 && fs::is_regular_file(folder / CONVERTER, error))
            return (folder / CONVERTER).string();
    }
    return CONVERTER;
}

/// Ignores keyboard interrupts, which reach the child too: this program waits for its end and cleans up.
class InterruptsIgnored
{
public:
    InterruptsIgnored()
    {
        struct sigaction ignore = {};
        ignore.sa_handler = SIG_IGN;
        sigaction(SIGINT, &ignore, &m_interrupt);
        sigaction(SIGQUIT, &ignore, &m_quit);
    }
    ~InterruptsIgnored()
    {
        sigaction(SIGINT, &m_interrupt, nullptr);
        sigaction(SIGQUIT, &m_quit, nullptr);
    }
    InterruptsIgnored(const InterruptsIgnored&) = delete;
    InterruptsIgnored& operator=(const InterruptsIgnored&) = delete;

private:
    struct sigaction m_interrupt = {};
    struct sigaction m_quit = {};
};

/// Runs a program without its standard output.
/// @return its exit code; 0 to 255, more for a signal that ended it, negative with errno for no program.
int runProgram(const std::vector<std::string>& words)
{
    std::vector<std::string> copies = words; // posix_spawn takes writable strings
    std::vector<char*> arguments;
    arguments.reserve(copies.size() + 1);
    for (std::string& word : copies)
        arguments.push_back(word.data());
    arguments.push_back(nullptr);

    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    sigset_t restored;
    sigemptyset(&restored);
    sigaddset(&restored, SIGINT);
    sigaddset(&restored, SIGQUIT);
    posix_spawnattr_setsigdefault(&attributes, &restored);
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGDEF);

    const InterruptsIgnored guard;
    pid_t child = 0;
    const int reason =
        posix_spawnp(&child, words[0].c_str(), &actions, &attributes, arguments.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    posix_spawnattr_destroy(&attributes);
    if (reason != 0)
    {
        errno = reason;
        return -1;
    }
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR)
        continue;
    return WIFEXITED(status) ? WEXITSTATUS(status) : 256 + WTERMSIG(status);
}

} // namespace

std::unique_ptr<ConvertedModel> ConvertedModel::create(const std::string& model,
                                                       std::vector<std::string> arguments, std::string& error)
{
    std::error_code reason;
    std::string folder = (fs::temp_directory_path(reason) / "orv-view-XXXXXX").string();
    if (reason || !mkdtemp(folder.data()))
    {
        error = "no temporary folder for what " + model +
                " is converted to: " + (reason ? reason.message() : std::strerror(errno));
        return nullptr;
    }
    std::unique_ptr<ConvertedModel> conversion(new ConvertedModel);
    conversion->m_program = findConverter();
    conversion->m_model = model;
    conversion->m_arguments = std::move(arguments);
    conversion->m_folder = folder;
    conversion->m_scene = folder + "/" + fs::path(model).stem().string() + ".glo";
    return conversion;
}

ConvertedModel::~ConvertedModel()
{
    std::error_code error;
    fs::remove_all(m_folder, error);
}

bool ConvertedModel::run(std::string& error)
{
    std::vector<std::string> words = {m_program, m_model, m_scene};
    words.insert(words.end(), m_arguments.begin(), m_arguments.end());
    const int code = runProgram(words);
    if (code == 0)
        return true;
    if (code < 0)
        error = m_model + ": is no scene file, and there is no " + CONVERTER +
                " beside this program or on the PATH to convert it: " + std::strerror(errno);
    else if (code > 255)
        error = m_model + ": " + CONVERTER + " was ended by signal " + std::to_string(code - 256);
    else
        error = m_model + ": cannot be converted";
    return false;
}

} // namespace view
