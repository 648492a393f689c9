#pragma once

#include <string>

namespace CLI
{
class App;
}

namespace commandline
{

/// The manual page of a program, for man(1), made from its --help.
/// @param version  as "1.0.0".
std::string makeManual(const CLI::App& app, const std::string& version);

/// A shell's completions of the program's options and their arguments.
/// @param shell  "bash", "zsh" or "fish".
/// @return empty for any other shell.
std::string makeCompletion(const CLI::App& app, const std::string& shell);

} // namespace commandline
