#pragma once

#include "manual.h"

#include "orv/version.h"

#include <CLI/CLI.hpp>

#include <cerrno>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

/// Code shared by the command lines of all tools.
namespace commandline
{

constexpr int FAILED = 1; ///< exit codes
constexpr int MISUSED = 2;

/// Adds --version, errors that begin with the program's name, and two hidden options for the build: --manual prints the
/// manual page, --completion bash, zsh or fish prints completions.
inline void addCommon(CLI::App& app)
{
    const orv::Version& version = orv::getVersion();
    const std::string number = std::to_string(version.getMajor()) + "." + std::to_string(version.getMinor()) +
                               "." + std::to_string(version.getPatch());
    app.set_version_flag("--version", app.get_name() + " " + number);
    const auto print = [](const std::string& text)
    {
        std::fputs(text.c_str(), stdout);
        throw CLI::Success();
    };
    app.add_flag_callback("--manual", [&app, print, number] { print(makeManual(app, number)); })->group("");
    app.add_option_function<std::string>("--completion", [&app, print](const std::string& shell)
                                         { print(makeCompletion(app, shell)); })
        ->check(CLI::IsMember({"bash", "zsh", "fish"}))
        ->group("");
    app.failure_message([](const CLI::App* failed, const CLI::Error& error)
                        { return failed->get_name() + ": " + error.what() + "; --help shows how\n"; });
}

/// For options that take numbers with a fraction: CLI::Range lets "nan" pass.
inline CLI::Validator refuseNan()
{
    return CLI::Validator(
        [](const std::string& text)
        { return std::isnan(std::strtod(text.c_str(), nullptr)) ? text + ": not a number" : ""; },
        "");
}

/// Call it after all output: output that could not be written, to a full disk for instance, is an error.
/// @param exitCode  the program's otherwise.
/// @return exitCode, or FAILED instead of 0 if output is missing.
inline int finishOutput(const char* program, int exitCode)
{
    const bool wasLost = std::ferror(stdout) != 0;
    if (std::fflush(stdout) == 0 && !wasLost)
        return exitCode;
    std::fprintf(stderr, "%s: standard output: %s\n", program,
                 errno ? std::strerror(errno) : "cannot be written");
    return exitCode == 0 ? FAILED : exitCode;
}

/// The same for a command line that did not parse, or asked for help or the version.
inline int finishParsing(const CLI::App& app, const CLI::ParseError& error)
{
    return finishOutput(app.get_name().c_str(), app.exit(error) == 0 ? 0 : MISUSED);
}

} // namespace commandline
