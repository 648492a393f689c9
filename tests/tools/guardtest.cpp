#include "convert/guard.h"

#include <gtest/gtest.h>

#include <csignal>

#include <unistd.h>

using convert::Limits;

// Memory is up to the test of the program: this one counts allocations, and does not ask the handler.
//
// Fault caught: a child whose end of whatever kind stops the parent, goes unnoticed, or is taken for success.
TEST(Guard, saysWhatTheChildDiedOf)
{
    const auto endless = [](std::FILE*)
    {
        for (;;)
            pause();
        return true;
    };
    const auto writes = [](std::FILE* stream) { return std::fputs("whole", stream) >= 0; };
    const auto fails = [](std::FILE* stream) { return std::fputs("half", stream) < 0; };
    const struct
    {
        const char* name;
        Limits limits;
        std::function<bool(std::FILE*)> work;
        const char* error; // empty for none
    } cases[] = {
        {"a success", {60.0, 0}, writes, ""},
        {"a success without any limit", {0.0, 0}, writes, ""},
        {"half a result", {60.0, 0}, fails, "ended early (exit code 1)"},
        {"a hang", {0.05, 0}, endless, "not done after 0.05 seconds (see --time-limit)"},
        {"an early exit", {60.0, 0}, [](std::FILE*) -> bool { _exit(0); }, "no result"},
        {"a kill", {60.0, 0}, [](std::FILE*) { return raise(SIGKILL) == 0; }, "was killed"},
        {"a crash", {60.0, 0}, [](std::FILE*) { return raise(SIGTRAP) == 0; }, "crashed (SIGTRAP)"},
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
        const bool done = convert::runGuarded(item.limits, item.work, accept, error);
        EXPECT_EQ(*item.error == '\0', done) << item.name;
        EXPECT_EQ(done ? "whole" : "", received) << item.name;
        EXPECT_TRUE(done ? error.empty() : error.find(item.error) != std::string::npos)
            << item.name << ": " << error;
    }
}
