#include "convert/guard.h"

#include "convert/confinement.h"
#include "convert/files/filegate.h"
#include "convert/files/modelfiles.h"

#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <csignal>
#include <cstdlib>

#include <fcntl.h>
#include <seccomp.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

using convert::Limits;
using convert::ModelFiles;

// Fault caught: what a library says when it dies, beside the one line that this program has for it.
TEST(Guard, passesOnNothingThatTheChildSays)
{
    if (!convert::CAN_LIMIT_MEMORY)
        GTEST_SKIP() << "checks of addresses are to be heard";
    convert::FileGate gate("model");
    const auto dies = [](std::FILE*, ModelFiles&) -> bool
    {
        std::fputs("free(): invalid pointer\n", stderr);
        std::abort();
    };
    std::string error;
    testing::internal::CaptureStderr();
    EXPECT_FALSE(convert::runGuarded(
        {60.0, 0}, "model.3mf", gate, dies, [](std::FILE*) { return true; }, error));
    EXPECT_EQ(std::string::npos, testing::internal::GetCapturedStderr().find("free()"));
    EXPECT_NE(std::string::npos, error.find("known to crash on some sound 3MF files")) << error;
}

// Memory is up to the test of the program: this one counts allocations, and does not ask the handler.
//
// Fault caught: a child whose end of whatever kind stops the parent, goes unnoticed, or is taken for success.
TEST(Guard, saysWhatTheChildDiedOf)
{
    const auto endless = [](std::FILE*, ModelFiles&)
    {
        for (;;)
            pause();
        return true;
    };
    const auto writes = [](std::FILE* stream, ModelFiles&) { return std::fputs("whole", stream) >= 0; };
    const auto fails = [](std::FILE* stream, ModelFiles&) { return std::fputs("half", stream) < 0; };
    const struct
    {
        const char* name;
        Limits limits;
        convert::Work work;
        const char* error; // empty for none
    } cases[] = {
        {"a success", {60.0, 0}, writes, ""},
        {"a success without any limit", {0.0, 0}, writes, ""},
        {"half a result", {60.0, 0}, fails, "ended early (exit code 1)"},
        {"a hang", {0.05, 0}, endless, "not done after 0.05 seconds (see --time-limit)"},
        {"an early exit", {60.0, 0}, [](std::FILE*, ModelFiles&) -> bool { _exit(0); }, "no result"},
        {"a kill", {60.0, 0}, [](std::FILE*, ModelFiles&) { return raise(SIGKILL) == 0; }, "was killed"},
        {"a crash",
         {60.0, 0},
         [](std::FILE*, ModelFiles&) { return raise(SIGTRAP) == 0; },
         "crashed (SIGTRAP)"},
    };
    for (const auto& item : cases)
    {
        std::string error;
        std::string received;
        const auto accept = [&](std::FILE* stream)
        {
            char text[8] = {};
            received.assign(text, std::fread(text, 1, sizeof text, stream));
            return received == "whole";
        };
        convert::FileGate gate("model.obj");
        const bool done = convert::runGuarded(item.limits, "model.obj", gate, item.work, accept, error);
        EXPECT_EQ(*item.error == '\0', done) << item.name;
        EXPECT_EQ(done ? "whole" : "", received) << item.name;
        EXPECT_TRUE(done ? error.empty() : error.find(item.error) != std::string::npos)
            << item.name << ": " << error;
    }
}

namespace
{

/// Whether this system confines processes, found out by one that ends then.
bool canConfine()
{
    const pid_t child = fork();
    std::string error;
    if (child == 0)
        _exit(convert::confine(-1, error) ? 0 : 1);
    int status = 1;
    waitpid(child, &status, 0);
    return convert::CAN_CONFINE && status == 0;
}

/// Twice, in a process that may not install filters any more, and ends with 0 if all went well.
[[noreturn]] void workWithoutConfinement()
{
    scmp_filter_ctx filter = seccomp_init(SCMP_ACT_ALLOW);
    seccomp_rule_add(filter, SCMP_ACT_ERRNO(EPERM), SCMP_SYS(seccomp), 0);
    const scmp_arg_cmp isFilter = {0, SCMP_CMP_EQ, PR_SET_SECCOMP, 0};
    seccomp_rule_add_array(filter, SCMP_ACT_ERRNO(EPERM), SCMP_SYS(prctl), 1, &isFilter);
    seccomp_load(filter);
    const auto work = [](std::FILE* stream, ModelFiles&) { return std::fputs("whole", stream) >= 0; };
    const auto accept = [](std::FILE*) { return true; };
    convert::FileGate gate("model.obj");
    std::string error;
    bool done = true;
    for (int pass = 0; pass < 2; ++pass)
        done = done && convert::runGuarded({60.0, 0}, "model.obj", gate, work, accept, error);
    _exit(done ? 0 : 1);
}

} // namespace

// Fault caught: a system without confinement, such as a container, where nothing can be converted or no message says
// so.
TEST(Guard, saysWhereTheSystemRefuses)
{
    if (!convert::CAN_CONFINE)
        GTEST_SKIP() << "this build does not confine processes";
    EXPECT_EXIT(workWithoutConfinement(), testing::ExitedWithCode(0),
                "^orv-convert: this system does not confine processes [^\n]*\n$");
}

// Fault caught: a reader taken over by a file that reaches more than the model's own files.
TEST(Guard, childHasTheModelsFilesAndNothingElse)
{
    if (!canConfine())
        GTEST_SKIP() << "this system or this build does not confine processes";
    const support::TempDir folder;
    const std::string model = folder.write("inner/model.obj", std::string("v 0 0 0"));
    const std::string own = folder.write("inner/own.bin", std::string("own"));
    const std::string secret = folder.write("secret.bin", std::string("secret"));
    const int inherited = open(secret.c_str(), O_RDONLY);
    const pid_t parent = getpid();
    const auto work = [&](std::FILE* stream, ModelFiles& files)
    {
        std::vector<uint8_t> bytes;
        char byte = 0;
        struct stat status = {};
        char* const arguments[] = {nullptr};
        const struct
        {
            const char* name;
            bool isDone;
        } deeds[] = {
            {"own", files.read(own, bytes)},
            {"list", files.list(folder.path("inner")).size() == 2},
            {"memory", !std::vector<char>(64 << 20, 1).empty()},
            {"refused", files.read(secret, bytes)},
            {"refused list", !files.list(folder.path()).empty()},
            {"open", open(own.c_str(), O_RDONLY) >= 0},
            {"create", open(folder.path("new").c_str(), O_WRONLY | O_CREAT, 0600) >= 0},
            {"remove", unlink(own.c_str()) == 0},
            {"stat", stat(own.c_str(), &status) == 0},
            {"inherited", read(inherited, &byte, 1) == 1},
            {"network", socket(AF_INET, SOCK_STREAM, 0) >= 0},
            {"local", socket(AF_UNIX, SOCK_STREAM, 0) >= 0},
            {"run", execv("/bin/true", arguments) == 0},
            {"signal", kill(parent, 0) == 0},
            {"fork", fork() >= 0},
        };
        for (const auto& deed : deeds)
            std::fprintf(stream, "%s", deed.isDone ? (std::string(deed.name) + " ").c_str() : "");
        return true;
    };
    std::string done;
    const auto accept = [&](std::FILE* stream)
    {
        char text[200] = {};
        done.assign(text, std::fread(text, 1, sizeof text, stream));
        return true;
    };
    convert::FileGate gate(model);
    std::string error;
    EXPECT_TRUE(convert::runGuarded({60.0, 0}, model, gate, work, accept, error)) << error;
    EXPECT_EQ("own list memory ", done);
    EXPECT_TRUE(gate.wasOpened(own));
    EXPECT_FALSE(gate.wasOpened(secret));
    close(inherited);
}
